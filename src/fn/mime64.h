#pragma once

#include "fn/rmem.h"

#include <string>

/// Base64 text (RFC 4648, with padding and without line ends).
using FNMime64String = std::string;

FNMime64String FNEncodeMime64(const FNRMem<unsigned char>& block);
/// Characters outside the alphabet are skipped.
FNRMem<unsigned char> FNDecodeMime64(const FNMime64String& text);
