#include "model_sums.h"

#include "fn/exception.h"

#include <array>
#include <fstream>
#include <sstream>
#include <vector>

#include <cryptopp/filters.h>
#include <cryptopp/hex.h>
#include <cryptopp/sha.h>

namespace Orbek::Models {

namespace fs = std::filesystem;

std::string sha256(const fs::path& file) {
    std::ifstream stream(file, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, file.string() + ": cannot be opened for reading");
    CryptoPP::SHA256 hash;
    std::vector<char> block(1 << 20);
    while (stream) {
        stream.read(block.data(), static_cast<std::streamsize>(block.size()));
        hash.Update(reinterpret_cast<const CryptoPP::byte*>(block.data()),
                    static_cast<std::size_t>(stream.gcount()));
    }
    if (stream.bad()) FN_THROW(FNEIOError, file.string() + ": error while reading");
    std::array<CryptoPP::byte, CryptoPP::SHA256::DIGESTSIZE> digest;
    hash.Final(digest.data());
    std::string text;
    CryptoPP::ArraySource(digest.data(), digest.size(), true,
                          new CryptoPP::HexEncoder(new CryptoPP::StringSink(text), false));
    return text;
}

std::map<std::string, std::string> readSums(const fs::path& list) {
    std::ifstream stream(list);
    if (!stream) FN_THROW(FNEIOError, list.string() + ": cannot be opened for reading");
    std::map<std::string, std::string> sums;
    for (std::string line; std::getline(stream, line);) {
        if (line.empty()) continue;
        std::istringstream fields(line);
        std::string sum, path, more;
        const bool complete = static_cast<bool>(fields >> sum >> path) && !(fields >> more);
        const bool hexadecimal = sum.find_first_not_of("0123456789abcdef") == std::string::npos;
        if (!complete || !hexadecimal || sum.size() != 2 * CryptoPP::SHA256::DIGESTSIZE)
            FN_THROW(FNEBadFormat, list.string() + ": not a sum and a path: " + line);
        sums[path] = sum;
    }
    return sums;
}

} // namespace Orbek::Models
