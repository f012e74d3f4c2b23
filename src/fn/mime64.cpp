#include "fn/mime64.h"

#include <algorithm>

#include <cryptopp/base64.h>

FNMime64String FNEncodeMime64(const FNRMem<unsigned char>& block) {
    constexpr bool lineBreaks = false;
    FNMime64String text;
    CryptoPP::StringSource(block.data(), block.size(), true,
                           new CryptoPP::Base64Encoder(new CryptoPP::StringSink(text), lineBreaks));
    return text;
}

FNRMem<unsigned char> FNDecodeMime64(const FNMime64String& text) {
    std::string bytes;
    CryptoPP::StringSource(text, true, new CryptoPP::Base64Decoder(new CryptoPP::StringSink(bytes)));
    FNRMem<unsigned char> block(bytes.size());
    std::copy(bytes.begin(), bytes.end(), block.getExclusive());
    return block;
}
