#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"
#include "support/scratch_folder.h"

#include <filesystem>
#include <string>
#include <vector>

/// A folder of its own for one test, where other programs make files.
class Workshop {
public:
    /// Whether a program is installed; for "convert", whether it is ImageMagick's.
    static bool has(const std::string& program);

    std::string path(const std::string& name) const { return folder_.file(name); }
    /// Runs a command line in the folder. @throws std::runtime_error if it fails.
    void run(const std::string& command) const;
    void write(const std::string& name, const std::string& bytes) const { folder_.write(name, bytes); }

private:
    ScratchFolder folder_;
};

std::string bytesOfFile(const std::filesystem::path& path);

/// The files below tests/fn/imagefile/fixtures, or one folder of it. Those whose names begin with "refused"
/// are of a kind that the readers do not accept, unless they take rare variants.
std::vector<std::filesystem::path> fixtures(const std::string& folder = {});
bool isRefused(const std::filesystem::path& fixture, const Fn::ImageLimits& limits = {});
std::string fixture(const std::string& name);

/// Test pictures of 13 x 9 pixels: smooth colours and grays; grays of 1, 2 or 4 bits stretched to 8; and 16
/// bits.
FNImage<Fn::Bgra32> colorPicture();
FNImage<unsigned char> grayPicture();
FNImage<unsigned char> coarsePicture(unsigned bits);
FNImage<unsigned short> widePicture();
FNImage<Fn::Rgb48> wideColorPicture();

/// They as PGM and PPM files, written without the library.
std::string netpbm(const FNImage<unsigned char>& image);
std::string netpbm(const FNImage<unsigned short>& image);
std::string netpbm(const FNImage<Fn::Bgra32>& image);
std::string netpbm(const FNImage<Fn::Rgb48>& image);

/// Greatest difference of a sample, 1000 if the sizes differ.
int largestDifference(const FNImageReference& a, const FNImageReference& b);

/// Keeps what a reader tells.
class RecordedProperties {
public:
    RecordedProperties()
        : body_(new Body), feedback(FNCountedPtr<Fn::ReadImagePropertiesFeedback::Body>(body_)) {}
    int mode() const { return body_->mode; }
    int depth() const { return body_->depth; }

private:
    struct Body final : Fn::ReadImagePropertiesFeedback::Body {
        void compressionMode(const Fn::FNImageDataCompressionMode& m) override { mode = static_cast<int>(m); }
        void pixelDepth(unsigned int bits) override { depth = static_cast<int>(bits); }
        int mode = -1;
        int depth = -1;
    };
    Body* body_;

public:
    const Fn::ReadImagePropertiesFeedback feedback;
};
