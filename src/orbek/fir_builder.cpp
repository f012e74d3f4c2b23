#include "orbek/fir_builder.h"

#include "orbek/implementation/comparison.h"

#include <istream>

namespace Orbek {

class FIRBuilder::Implementation : public Comparison {
public:
    explicit Implementation(const Configuration& configuration)
        : Comparison(configuration), builder(strategy().algorithm()->createRecordBuilder()) {}

    FIR build(const Fn::Package& package) const {
        return FIR::Implementation::make(builder->create(package));
    }

    const Cmp::RecordBuilder builder;
};

FIRBuilder::FIRBuilder(const Configuration& configuration)
    : implementation_(new Implementation(configuration)) {}
FIRBuilder::FIRBuilder(const FIRBuilder&) = default;
FIRBuilder& FIRBuilder::operator=(const FIRBuilder&) = default;
FIRBuilder::~FIRBuilder() = default;

FIR FIRBuilder::build(std::istream& stream) const {
    return implementation_->build(Fn::Package(stream));
}

FIR FIRBuilder::build(const unsigned char* data, unsigned int size) const {
    return FIR::Implementation::make(implementation_->builder->createFromBytes({data, size}));
}

FIR FIRBuilder::build(unsigned char*& memory) const {
    return FIR::Implementation::make(implementation_->builder->createFromMemento(memory));
}

FIR FIRBuilder::buildVoidFIR() const {
    return FIR::Implementation::make(implementation_->builder->createVoid());
}

} // namespace Orbek
