#pragma once

#include <cstdint>

namespace Fn {

/// What an image file may make its reader do. Every reader takes limits as its last argument, and refuses a
/// file that announces more, before it allocates for it. New limits are the defaults of the process, which
/// hold for whatever comes from outside; a caller who trusts his files passes greater ones:
///
///     Fn::ImageLimits limits;
///     limits.maxBytes = 8ull << 30;
///     const FNImageReference mosaic = Fn::readImage("mosaic.tif", {}, limits);
struct ImageLimits {
    /// The defaults of the process.
    ImageLimits();
    /// They, and rare variants too: for files that people have.
    static ImageLimits withRareVariants();
    /// Makes these the defaults of the process, but for rareVariants. May be called while others read.
    static void setDefaults(const ImageLimits& limits);

    /// Columns, rows and pixels of an image.
    std::uint32_t maxWidth = 65535;
    std::uint32_t maxHeight = 65535;
    std::uint64_t maxPixels = 1u << 27;
    /// Bytes of the decoded pixels, the decoder's working memory and, where it is read as a whole, the file
    /// together.
    std::uint64_t maxBytes = 1u << 30;
    /// Whether to read all variants of a format that can be decoded, such as JPEG in CMYK. Otherwise only the
    /// plain ones are read, which is all that records and packages hold: what can be stored there does not
    /// change with the libraries beneath.
    bool rareVariants = false;

    /// @param bytesPerPixel of decoding, result included
    /// @param reader name of the reading function for the message
    /// @throws FNEBadFormat if the image is larger than this allows.
    void check(std::uint64_t width, std::uint64_t height, std::uint64_t bytesPerPixel,
               const char* reader) const;
    /// What is left beside `bytes` of memory that are in use already.
    ImageLimits beside(std::uint64_t bytes) const;

private:
    struct BuiltIn {};
    explicit ImageLimits(BuiltIn) {}
    struct Defaults;
    static Defaults& defaults();
};

} // namespace Fn
