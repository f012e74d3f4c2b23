#pragma once

#include "fn/image_attributes.h"

#include <string>

namespace Fn {

/// `text` with a backslash before each `special` character.
std::string escape(const std::string& text, char special);

/// The attributes as one line of text: for each in key order key, "=" and the value in double quotes.
/// Newlines become
/// "\x0A", and "=" in a key and double quotes in a value get a backslash before them. Attributes with an
/// empty key or value are left out, since the text cannot hold them.
std::string buildAttributeString(const FNImageAttributes& attributes);

/// Reads such a text. @throws FNEIOError if it is none.
FNImageAttributes parseAttributes(const std::string& text);

} // namespace Fn
