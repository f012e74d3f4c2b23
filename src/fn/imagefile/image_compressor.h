#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <iosfwd>
#include <string>

/// Images as blocks of compressed bytes.
class FNImageCompressor {
public:
    enum Mode : int { LOSSLESS = 0, BEST_QUALITY = 1, MEDIUM_QUALITY = 2, LOW_QUALITY = 3 };
    enum Format : int { JPEG = 0, GZIP = 1 };

    using Bytes = FNRMem<unsigned char>;

    /// JPEG quality 100, 80 and 50 of the three lossy modes, 0 of anything else.
    static int jpegQuality(Mode mode);

    /// JPEG in one of the lossy modes. @throws FNEBadArg for anything else.
    static Bytes compress(const FNImage<Fn::Bgra32>& image, Mode mode, Format format);
    static Bytes compress(const FNImage<unsigned char>& image, Mode mode, Format format);

    /// A file of three components (alpha is lost) or of one.
    /// @param quality 1 to 100
    /// @throws FNEBadArg for another quality or an image that JPEG cannot hold (no pixels, sizes above
    /// 65500).
    static Bytes compressJpeg(const FNImage<Fn::Bgra32>& image, int quality);
    static Bytes compressJpeg(const FNImage<unsigned char>& image, int quality);

    /// @throws FNEBadArg if the format is not JPEG or the bytes are not of it.
    static FNImageReference decompress(Format format, const Bytes& bytes);

    /// Reads one JPEG image and leaves a stream that can go back behind it. See Fn::readJpeg().
    static FNImageReference decompressJpeg(std::istream& stream,
                                           const Fn::ReadImagePropertiesFeedback& feedback = {},
                                           const Fn::ImageLimits& limits = {}, const std::string& name = {});
};
