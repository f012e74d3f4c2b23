#pragma once

#include "fn/rmem.h"

#include <memory>
#include <string>
#include <vector>

#include <openjpeg.h>

/// OpenJPEG's objects as scoped values, and its streams over memory. Private to the JPEG 2000 reader and
/// writer.

namespace Fn::J2k {

template <auto function> struct Release {
    template <class T> void operator()(T* object) const { function(object); }
};
using Stream = std::unique_ptr<opj_stream_t, Release<opj_stream_destroy>>;
using Codec = std::unique_ptr<opj_codec_t, Release<opj_destroy_codec>>;
using Image = std::unique_ptr<opj_image_t, Release<opj_image_destroy>>;

/// What the library reports as errors.
struct Report {
    std::string text;
    void listenTo(opj_codec_t* codec);
};

/// Reads from bytes that outlive the stream.
class Input {
public:
    explicit Input(const FNRMem<unsigned char>& bytes);
    opj_stream_t* stream() const { return stream_.get(); }

private:
    FNRMem<unsigned char> bytes_;
    std::uint64_t position_ = 0;
    Stream stream_;
};

/// Collects what is written.
class Output {
public:
    Output();
    opj_stream_t* stream() const { return stream_.get(); }
    /// Complete after the stream's end.
    const std::vector<unsigned char>& bytes() const { return bytes_; }

private:
    std::vector<unsigned char> bytes_;
    std::uint64_t position_ = 0;
    Stream stream_;
};

} // namespace Fn::J2k
