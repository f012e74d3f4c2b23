#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"
#include "fn/message/dialog.h"

#include <cstdlib>

/// Feeds `data` to a reader of image files, without and with rare variants: it gives an image within small
/// limits, or throws one of our exceptions.
template <class Read> int fuzzImageReader(const unsigned char* data, std::size_t size, Read read) {
    struct Silence final : FNDialog::Body {
        void log(const std::string&) override {}
        void info(const std::string&) override {}
        void warn(const std::string&) override {}
        void error(const std::string&) override {}
        std::string name() const override { return "Silence"; }
    };
    static const bool silent = (FNDialog::set(FNCountedPtr<FNDialog::Body>(new Silence)), true);
    Fn::ImageLimits limits;
    limits.maxPixels = 1u << 18;
    limits.maxBytes = 1u << 24;
    for (const bool rareVariants : {false, true}) {
        limits.rareVariants = rareVariants;
        Fn::MemoryStream stream(reinterpret_cast<const char*>(data), size);
        try {
            const FNImageReference image =
                read(static_cast<std::istream&>(stream), Fn::ReadImagePropertiesFeedback(), limits);
            if (!silent || std::uint64_t{image.w()} * image.h() > limits.maxPixels) std::abort();
        } catch (const FNException&) {
        }
    }
    return 0;
}
