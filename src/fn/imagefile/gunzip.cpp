#include "fn/imagefile/gunzip.h"

#include <algorithm>
#include <memory>
#include <vector>

#include <fcntl.h>
#include <unistd.h>
#include <zlib.h>

namespace Fn {

namespace {

struct Close {
    void operator()(gzFile file) const { gzclose(file); }
};

} // namespace

FNRMem<unsigned char> gunzip(const std::string& fileName, const ImageLimits& limits) {
    const int descriptor = ::open(fileName.c_str(), O_RDONLY | O_CLOEXEC);
    if (descriptor < 0) FN_THROW(FNEIOError, "gunzip(): cannot open " + fileName + " for reading");
    const std::unique_ptr<gzFile_s, Close> file(gzdopen(descriptor, "rb"));
    if (!file) {
        ::close(descriptor);
        FN_THROW(FNEIOError, "gunzip: error in gzopen() for " + fileName);
    }

    std::vector<unsigned char> bytes;
    for (std::size_t step = 1u << 16;; step = std::min<std::size_t>(bytes.size(), 1u << 26)) {
        const std::size_t before = bytes.size();
        bytes.resize(before + step);
        const int n = gzread(file.get(), bytes.data() + before, static_cast<unsigned int>(step));
        int error = Z_OK; // a file that ends too early gives its bytes first, then this
        gzerror(file.get(), &error);
        if (n < 0 || (error != Z_OK && error != Z_STREAM_END))
            FN_THROW(FNEIOError, "gunzip: error in gzread() with " + fileName);
        bytes.resize(before + static_cast<std::size_t>(n));
        if (bytes.size() > limits.maxBytes)
            FN_THROW(FNEBadFormat, "gunzip: " + fileName + " exceeds the limit of " +
                                       std::to_string(limits.maxBytes) + " bytes for decoding");
        if (n == 0) break;
    }
    FNRMem<unsigned char> result(bytes.size());
    std::copy(bytes.begin(), bytes.end(), result.getExclusive());
    return result;
}

} // namespace Fn
