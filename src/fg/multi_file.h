#pragma once

#include "fg/still_image_source.h"
#include "fn/deployment/component.h"

namespace FG {

/// Plays a list of image files as if a camera delivered them: in a loop or once, with the capture times of a
/// camera of a given frame rate, and as fast as possible or at a given rate. Settings are those of
/// MultiFileDef.
///
/// May be used by several threads, which share its pace.
class MultiFile final : public Fn::LiveVideoSource {
public:
    /// Lists the files and, with `ImageCaching`, reads them all.
    /// @param name of the device
    /// @throws FNEBadArg for a rate that is not positive, without any file, or for a file that is read and is
    /// no image: all with `ImageCaching`, otherwise the first; FNEIOError for a directory that cannot be read
    MultiFile(const Fn::Deployment::Component& component, const std::string& name);
    MultiFile(const MultiFile&);
    ~MultiFile() override;

    /// The next image, with its capture time (and the exposure time, where one is set) as attributes.
    /// @throws what Fn::readImage() throws; then the next call tries the same file
    FNImageReference grab() override;
    std::string id() override;
    /// Size of the first image.
    unsigned int w() override;
    unsigned int h() override;
    /// Hands out the files' own bytes; shares the list of files with this.
    FNCountedPtr<StillImageSource> stillImageSource() const;

    unsigned int gain() override { return 0; }
    Range gainRange() override { return {}; }
    void setGain(unsigned int value) override;
    unsigned int contrast() override { return 0; }
    Range contrastRange() override { return {}; }
    void setContrast(unsigned int value) override;

    class Implementation;

private:
    FNCountedPtr<Implementation> implementation_;
};

/// Milliseconds in which a MultiFile looks again whether the next image is due: a tenth of the period in
/// whole ones, so that there is no pause above 100 images a second.
/// @param period seconds from one image to the next
unsigned long deliveryStep(float period);

/// The files of a MultiFile as single pictures.
class MFileStillImageSource final : public StillImageSource {
public:
    explicit MFileStillImageSource(const FNCountedPtr<MultiFile::Implementation>& implementation);
    ~MFileStillImageSource() override;

    std::string id() override;
    /// The bytes of the next file. @throws FNEIOError if it cannot be read
    FNRMem<unsigned char> release() override;
    FNImageReference extractImage(const FNRMem<unsigned char>& bytes,
                                  const Fn::ReadImagePropertiesFeedback& feedback) override;
    unsigned int gain() override { return 0; }
    Range gainRange() override { return {}; }
    void setGain(unsigned int value) override;
    unsigned int exposure() override { return 0; }
    Range exposureRange() override { return {}; }
    void setExposure(unsigned int value) override;

private:
    FNCountedPtr<MultiFile::Implementation> implementation_;
};

} // namespace FG
