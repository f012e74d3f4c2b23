#include "cmp/evidence_frame.h"

#include "fn/image_blit.h"
#include "fn/imagefile/image_limits.h"

#include <cmath>
#include <stdexcept>

namespace Cmp {

using FaceInfo = EvidenceFrame::FaceInfo;
using FaceInfos = EvidenceFrame::FaceInfos;
using CroppedFaces = Fn::SerializableMap<std::string, CroppedFace>;

CroppedFace::CroppedFace(const Fn::Package& package) : CroppedFace(Fn::PackageReader(package)) {}

CroppedFace::CroppedFace(Fn::PackageReader reader) : Face(reader.next<Fn::Package>()) {
    const auto origin = reader.next<FNPair<int, int>>();
    origin_ = {origin.first, origin.second};
    croppingFactor_ = reader.next<float>();
    reader.expectEnd();
}

Fn::Package CroppedFace::serialize() const {
    return Fn::Package(std::list<Fn::Package>{Face::serialize(),
                                              Fn::Package(FNPair<int, int>(origin_.x, origin_.y)),
                                              Fn::Package(croppingFactor_)});
}

namespace {

const FaceInfo* findFace(const FaceInfos& faces, const std::string& id) {
    const auto face = std::ranges::find(faces, id, &FaceInfo::identity);
    return face == faces.end() ? nullptr : &*face;
}

CroppedFace cropOf(const FNImageReference& image, const FaceFinder::Location& location, float factor,
                   EvidenceFrame::Strategy strategy) {
    const Face crop = cropFace(Face(image, location), factor);
    FNPos shift;
    try {
        shift = location.pos - crop.facePosition();
    } catch (const std::exception& e) {
        throw std::runtime_error(std::string("could not take face position after crop, because: ") +
                                 e.what());
    }
    crop.image().setSerializationStrategy(strategy);
    // The crop begins at a whole pixel; what is beside it is the rounding of the subtraction.
    return {crop, FNGridPos(FNPos(std::round(shift.x), std::round(shift.y))), factor};
}

/// The same face with an image handle and locations of its own.
Face duplicate(const Face& face) {
    const auto feature = [&](bool present, FacialFeatureLocation const& (Face::*location)() const) {
        return present ? Face::FeatureLocation(new FacialFeatureLocation((face.*location)()))
                       : Face::FeatureLocation();
    };
    return Face(FNImageReferenceFactory::duplicate(face.image()),
                face.hasFaceFinderInfo()
                    ? Face::FaceLocation(new FaceFinder::Location(face.faceFinderLocation()))
                    : Face::FaceLocation(),
                feature(face.hasEyeFinderLeftEyeInfo(), &Face::leftEyeLocation),
                feature(face.hasEyeFinderRightEyeInfo(), &Face::rightEyeLocation),
                feature(face.hasNasionInfo(), &Face::nasionLocation),
                feature(face.hasMouthInfo(), &Face::mouthLocation));
}

/// A frame of the pixel type `T` with the crops on a black ground.
template <class T>
FNImageReference assemble(const CroppedFaces& crops, std::uint32_t width, std::uint32_t height) {
    Fn::ImageLimits().check(width, height, sizeof(T), "Evidence");
    FNImage<T> frame(width, height);
    frame.fill(T{});
    for (const auto& [id, crop] : crops)
        if (crop.image().w() != 0) Fn::blitIntoImage<T>(crop.image(), frame, crop.origin());
    return FNImageReferenceFactory::create(frame);
}

FNImageReference assemble(const CroppedFaces& crops, std::uint32_t width, std::uint32_t height, bool colour) {
    const FNImageReference::PixelType type = crops.begin()->second.image().native();
    if (type == FNImageReference::BGRA32 ||
        (colour && (type == FNImageReference::MONO8 || type == FNImageReference::MONO16)))
        return assemble<Fn::Bgra32>(crops, width, height);
    if (type == FNImageReference::MONO8) return assemble<unsigned char>(crops, width, height);
    if (type == FNImageReference::MONO16) return assemble<unsigned short>(crops, width, height);
    FN_THROW(FNEBadFormat, "Unsupported image type in evidence");
}

} // namespace

class EvidenceFrame::Implementation {
public:
    Implementation() = default;
    explicit Implementation(const Fn::Package& package) {
        Fn::PackageReader reader(package);
        whole = reader.next<bool>();
        if (whole) {
            image = Image(new FNImageReference(reader.next<FNImageReference>()));
            width = image->w();
            height = image->h();
        } else {
            width = reader.next<unsigned int>();
            height = reader.next<unsigned int>();
            crops = reader.next<CroppedFaces>();
        }
        faces = reader.next<FaceInfos>();
        time = reader.next<Fn::TimeStamp>();
        reader.expectEnd();
    }

    Fn::Package serialize() {
        std::list<Fn::Package> elements{Fn::Package(whole)};
        if (whole) {
            elements.push_back(wholeImage()->serialize());
        } else {
            if (crops.empty()) createCroppedFaces();
            elements.push_back(Fn::Package(width));
            elements.push_back(Fn::Package(height));
            elements.push_back(Fn::Package(crops));
        }
        elements.push_back(Fn::Package(faces));
        elements.push_back(Fn::Package(time));
        return Fn::Package(elements);
    }

    const Image& wholeImage() const {
        if (!image) FN_THROW(FNEGeneric, "Complete evidence frame requested, but not found");
        return image;
    }

    const Image& img(bool colour) {
        if (whole) {
            wholeImage();
            if (colour && !image->isColor())
                setImage(FNImageReferenceFactory::create(image->toBgra32(), image->attributes()));
            return image;
        }
        const bool good = image && (!colour || image->isColor());
        if (!good && !crops.empty()) setImage(assemble(crops, width, height, colour));
        return image;
    }

    void createCroppedFaces() {
        crops.clear();
        for (const FaceInfo& face : faces) {
            if (!face.hasLocation())
                throw std::runtime_error(
                    "Evidence frame describe faces which do not have location information");
            crops.emplace(face.identity(), cropOf(*img(false), face.location(), croppingFactor, strategy));
        }
    }

    /// Crops that can be made again are out of date after a change of how they are made.
    void forgetCrops() {
        if (image) crops.clear();
    }

    bool whole = true;
    float croppingFactor = 1;
    Strategy strategy = FNImageReference::UNCOMPRESSED_RAW;
    Image image;
    unsigned int width = 0, height = 0;
    CroppedFaces crops;
    FaceInfos faces;
    Fn::TimeStamp time;
    FaceThumbNailFormat thumbnailFormat;

private:
    void setImage(const FNImageReference& made) {
        made.setSerializationStrategy(strategy);
        image = Image(new FNImageReference(made));
    }
};

EvidenceFrame::EvidenceFrame() : implementation_(new Implementation) {}

EvidenceFrame::EvidenceFrame(const FNImageReference& image, const FaceInfos& faces, const Fn::TimeStamp& time,
                             bool serializeWholeFrame)
    : EvidenceFrame() {
    implementation_->whole = serializeWholeFrame;
    implementation_->image = Image(new FNImageReference(image));
    implementation_->width = image.w();
    implementation_->height = image.h();
    implementation_->faces = faces;
    implementation_->time = time;
}

EvidenceFrame::EvidenceFrame(const Fn::Package& package) : implementation_(new Implementation(package)) {}
EvidenceFrame::EvidenceFrame(const EvidenceFrame&) = default;
EvidenceFrame& EvidenceFrame::operator=(const EvidenceFrame&) = default;
EvidenceFrame::~EvidenceFrame() = default;

Fn::Package EvidenceFrame::serialize() const {
    return implementation_->serialize();
}

Fn::TimeStamp EvidenceFrame::timeStamp() const {
    return implementation_->time;
}

const FaceInfos& EvidenceFrame::faceInfos() const {
    return implementation_->faces;
}

EvidenceFrame::Image EvidenceFrame::img(bool colour) const {
    return implementation_->img(colour);
}

void EvidenceFrame::setCroppingFactor(float factor) {
    implementation_->croppingFactor = factor;
    implementation_->forgetCrops();
}

void EvidenceFrame::setSerializeWholeFrame(bool whole) {
    implementation_->whole = whole;
}

bool EvidenceFrame::getSerializeWholeFrame() const {
    return implementation_->whole;
}

void EvidenceFrame::setThumbnailFormat(const FaceThumbNailFormat& format) {
    implementation_->thumbnailFormat = format;
}

EvidenceFrame::FaceThumbNailFormat EvidenceFrame::getThumbnailFormat() const {
    return implementation_->thumbnailFormat;
}

void EvidenceFrame::setImageCompressionMethod(const Strategy& strategy) {
    implementation_->strategy = strategy;
    implementation_->forgetCrops();
}

EvidenceFrame::Strategy EvidenceFrame::getImageCompressionMethod() const {
    return implementation_->strategy;
}

bool EvidenceFrame::hasFaceTrackInfo(const std::string& id) const {
    return findFace(implementation_->faces, id) != nullptr;
}

bool EvidenceFrame::faceTrackInfo(const std::string& id, FaceInfo& info) const {
    const FaceInfo* const face = findFace(implementation_->faces, id);
    if (face) info = *face;
    return face != nullptr;
}

Face EvidenceFrame::getFaceForID(const std::string& id, FaceType type) const {
    Implementation& frame = *implementation_;
    if (frame.crops.empty()) frame.createCroppedFaces();
    const auto crop = frame.crops.find(id);
    if (crop == frame.crops.end()) FN_THROW(FNEBadArg, "No data found in the frame for trackingID " + id);
    const std::uint32_t height = crop->second.image().h();
    if (height == 0) FN_THROW(FNEBadArg, "Trying to get thumbnail for frame with height=0");
    if (type != THUMBNAIL && type != CROPPED)
        FN_THROW(FNEBadArg, "Unknown face type requested " + std::to_string(static_cast<int>(type)));
    if (type == CROPPED) return crop->second;
    Face face = duplicate(crop->second); // since scaling changes the locations themselves
    face.scale(static_cast<float>(frame.thumbnailFormat.height) / static_cast<float>(height));
    face.image().setSerializationStrategy(frame.thumbnailFormat.strategy);
    return face;
}

EvidenceFrame EvidenceFrame::withFaces(const FaceInfos& faces) const {
    EvidenceFrame frame;
    frame.implementation_->whole = implementation_->whole;
    frame.implementation_->image = img(false);
    frame.implementation_->width = implementation_->width;
    frame.implementation_->height = implementation_->height;
    frame.implementation_->faces = faces;
    frame.implementation_->time = implementation_->time;
    frame.implementation_->strategy = implementation_->strategy;
    frame.implementation_->thumbnailFormat = implementation_->thumbnailFormat;
    return frame;
}

} // namespace Cmp
