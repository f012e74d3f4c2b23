#include "fn/imagefile/gunzip.h"

#include "fn/imagefile/byte_stream.h"

#include <algorithm>
#include <exception>
#include <vector>

#include <fcntl.h>
#include <unistd.h>
#include <zlib.h>

namespace Fn {

class GunzipStream::Buffer : public std::streambuf {
public:
    Buffer(const std::string& fileName, const ImageLimits& limits)
        : fileName_(fileName), limit_(limits.maxBytes), bytes_(kept + blockSize) {
        const int descriptor = ::open(fileName.c_str(), O_RDONLY | O_CLOEXEC);
        if (descriptor < 0) FN_THROW(FNEIOError, "gunzip(): cannot open " + fileName + " for reading");
        file_.reset(gzdopen(descriptor, "rb"));
        if (!file_) {
            ::close(descriptor);
            FN_THROW(FNEIOError, "gunzip: error in gzopen() for " + fileName);
        }
        setg(block(), block(), block());
    }

    void limitTo(std::uint64_t bytes) { limit_ = std::min(limit_, bytes); }

    void throwFailure() const {
        if (failure_) std::rethrow_exception(failure_);
    }

private:
    /// Behind the start of a block, so many bytes of the one before can be put back.
    static constexpr std::size_t kept = 64, blockSize = 1u << 16;

    struct Close {
        void operator()(gzFile file) const { gzclose(file); }
    };

    char* block() { return bytes_.data() + kept; }

    int_type underflow() override {
        std::vector<char> next(bytes_.size());
        const std::size_t size = inflateInto(next.data() + kept);
        if (size == 0) return traits_type::eof(); // what has been read can still be put back
        const std::size_t before = std::min(kept, static_cast<std::size_t>(egptr() - eback()));
        std::copy_n(egptr() - before, before, next.data() + kept - before);
        bytes_.swap(next);
        setg(block() - before, block(), block() + size);
        return traits_type::to_int_type(*gptr());
    }

    /// @return number of bytes, 0 at the end or after a failure
    std::size_t inflateInto(char* to) {
        if (failure_) return 0;
        try {
            const int n = gzread(file_.get(), to, blockSize);
            int error = Z_OK; // a file that ends too early gives its bytes first, then this
            gzerror(file_.get(), &error);
            if (n < 0 || (error != Z_OK && error != Z_STREAM_END))
                FN_THROW(FNEIOError, "gunzip: error in gzread() with " + fileName_);
            const auto size = static_cast<std::size_t>(n);
            size_ += size;
            if (size_ > limit_)
                FN_THROW(FNEBadFormat, "gunzip: " + fileName_ + " exceeds the limit of " +
                                           std::to_string(limit_) + " bytes for decoding");
            return size;
        } catch (...) {
            failure_ = std::current_exception();
            return 0;
        }
    }

    const std::string fileName_;
    std::uint64_t size_ = 0; ///< of all that has come
    std::uint64_t limit_;
    std::vector<char> bytes_;
    std::unique_ptr<gzFile_s, Close> file_;
    std::exception_ptr failure_;
};

GunzipStream::GunzipStream(const std::string& fileName, const ImageLimits& limits)
    : std::istream(nullptr), buffer_(std::make_unique<Buffer>(fileName, limits)) {
    rdbuf(buffer_.get());
}

GunzipStream::~GunzipStream() = default;

void GunzipStream::limitTo(std::uint64_t bytes) {
    buffer_->limitTo(bytes);
}

void GunzipStream::throwFailure() const {
    buffer_->throwFailure();
}

FNRMem<unsigned char> gunzip(const std::string& fileName, const ImageLimits& limits) {
    GunzipStream stream(fileName, limits);
    const FNRMem<unsigned char> content = readRest(stream, limits.maxBytes, "gunzip");
    stream.throwFailure();
    return content;
}

} // namespace Fn
