#include "fn/image_reference.h"

#include "fn/image_representation.h"

void FNImageReference::Representation::serialize(std::list<Fn::Package>& elements) const {
    elements.push_back(Fn::serialize(reservedNumber_));
    elements.push_back(Fn::serialize(reservedTime_));
}

FNImageReference::Representation::Representation(Fn::PackageReader& elements)
    : reservedNumber_(elements.next<Fn::Optional<unsigned int>>()),
      reservedTime_(elements.next<Fn::Optional<Fn::TimeStamp>>()) {}

FNImageReference::FNImageReference() {
    FNImage<unsigned char> black(1, 1);
    black.fill(0);
    *this = FNImageReferenceFactory::create(black);
}

FNImageReference::FNImageReference(const Fn::Package& package)
    : representation_(readRepresentation(package)) {}

Fn::Package FNImageReference::serialize() const {
    std::list<Fn::Package> elements;
    representation_->serialize(elements);
    return Fn::Package(elements);
}

FNBox FNImageReference::box() const {
    return {0, 0, static_cast<std::int32_t>(w()), static_cast<std::int32_t>(h())};
}
