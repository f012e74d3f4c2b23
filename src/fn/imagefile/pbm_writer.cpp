#include "fn/imagefile/pbm.h"

#include "fn/image_conversion.h"
#include "fn/imagefile/attribute_text.h"
#include "fn/whole_file.h"

#include <vector>

namespace Fn {

namespace {

void writeAttributes(const FNImageAttributes& attributes, std::ostream& target) {
    constexpr std::size_t textPerLine = 61; // of lines of 70 characters, with the newline
    const std::string text = buildAttributeString(attributes);
    for (std::size_t at = 0; at < text.size(); at += textPerLine)
        target << "# cache:" << text.substr(at, textPerLine) << '\n';
}

template <class Pixel>
void write(const FNImage<Pixel>& image, const FNImageAttributes& attributes, const FNBox& requested,
           std::ostream& target) {
    using Sample = typename SampleOf<Pixel>::Type;
    const FNBox box = requested & image.box();
    if (box.empty()) FN_THROW(FNEIOError, "Fn::writePbm: Error, region in image is empty");
    target << (isColorPixel<Pixel> ? "P6\n" : "P5\n") << "# Created by Fn::writePbm $Revision: 1.37 $\n";
    writeAttributes(attributes, target);
    // As text, not as numbers: a stream may carry a locale that groups digits.
    target << std::to_string(box.width()) << ' ' << std::to_string(box.height()) << '\n'
           << (sizeof(Sample) == 1 ? "255\n" : "65535\n");

    std::vector<unsigned char> row;
    const auto append = [&row](Sample sample) {
        if constexpr (sizeof(Sample) == 2) row.push_back(static_cast<unsigned char>(sample >> 8));
        row.push_back(static_cast<unsigned char>(sample & 0xFF));
    };
    for (FNConstImIter<Pixel> it(image, box); !it.atEnd(); it.nextRow()) {
        row.clear();
        for (const Pixel& p : it.restOfRow()) {
            if constexpr (isColorPixel<Pixel>) {
                append(p.r);
                append(p.g);
                append(p.b);
            } else {
                append(p);
            }
        }
        target.write(reinterpret_cast<const char*>(row.data()), static_cast<std::streamsize>(row.size()));
    }
    if (!target.flush()) FN_THROW(FNEIOError, "Fn::writePbm: error writing to stream");
}

} // namespace

void writePbm(const FNImageReference& image, std::ostream& target, const FNBox& box) {
    const FNImageAttributes& attributes = image.attributes();
    switch (image.native()) {
    case FNImageReference::MONO8:
        return write(image.toMono8(), attributes, box, target);
    case FNImageReference::BGRA32:
        return write(image.toBgra32(), attributes, box, target);
    case FNImageReference::RGB48:
        return write(image.toRgb48(), attributes, box, target);
    default:
        return write(image.toMono16(), attributes, box, target);
    }
}

void writePbm(const FNImageReference& image, const std::string& fileName, const FNBox& box) {
    writeWholeFile(fileName, [&](std::ostream& file) { writePbm(image, file, box); });
}

void writePgm(const FNImageReference& image, std::ostream& target) {
    write(image.toMono8(), image.attributes(), image.box(), target);
}

void writePpm(const FNImageReference& image, std::ostream& target) {
    write(image.toBgra32(), image.attributes(), image.box(), target);
}

} // namespace Fn
