#pragma once

#include "fn/imagefile/image_limits.h"
#include "fn/rmem.h"

#include <istream>
#include <memory>
#include <streambuf>
#include <string>

namespace Fn {

/// The content of a gzip file (RFC 1952), which is inflated while it is read.
class GunzipStream : public std::istream {
public:
    /// @throws FNEIOError if the file cannot be opened
    explicit GunzipStream(const std::string& fileName, const ImageLimits& limits = {});
    ~GunzipStream() override;

    /// Lets no more than so many bytes come in all, if that is less than was allowed.
    void limitTo(std::uint64_t bytes);

    /// A stream turns what goes wrong beneath into its own state; this tells it.
    /// @throws FNEIOError if the file was found to be damaged; FNEBadFormat if its content exceeds
    /// limits.maxBytes
    void throwFailure() const;

private:
    class Buffer;
    std::unique_ptr<Buffer> buffer_;
};

/// The whole content of a gzip file. @throws FNEIOError if it cannot be read or is damaged; FNEBadFormat if
/// it exceeds limits.maxBytes.
FNRMem<unsigned char> gunzip(const std::string& fileName, const ImageLimits& limits = {});

} // namespace Fn
