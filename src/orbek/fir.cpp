#include "orbek/fir.h"

#include "orbek/implementation/comparison.h"

#include <ostream>

namespace Orbek {

FIR::FIR(const CountedPtr<Implementation>& implementation) : implementation_(implementation) {}
FIR::FIR(const FIR&) = default;
FIR& FIR::operator=(const FIR&) = default;
FIR::~FIR() = default;

std::size_t FIR::size() const {
    return implementation_->fir.serialize().size();
}

void FIR::serialize(std::ostream& stream) const {
    implementation_->fir.serialize().write(stream);
}

void FIR::serialize(unsigned char* memory) const {
    implementation_->fir.serialize().write(memory);
}

void FIR::writeTo(unsigned char*& memory) const {
    implementation_->fir.createMemento(memory);
}

std::size_t FIR::flatSize() const {
    return implementation_->fir.mementoSize();
}

std::string FIR::version() const {
    return implementation_->fir.version();
}

bool FIR::operator==(const FIR& other) const {
    return implementation_->fir.body() == other.implementation_->fir.body();
}

std::ostream& operator<<(std::ostream& stream, const FIR& fir) {
    fir.serialize(stream);
    return stream;
}

} // namespace Orbek
