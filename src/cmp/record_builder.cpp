#include "cmp/record_builder.h"

namespace Cmp {

Quality::Quality(const Fn::Package& package) {
    const FNPair<float, long> both(package);
    mean = both.first;
    duration = both.second;
}

Quality::operator Fn::Package() const {
    return Fn::Package(FNPair<float, long>(mean, duration));
}

Fn::Package RecordBuilder::Body::createMemento() const {
    FN_THROW(FNEBadFunCall, "Recordbuilder::createMemento not supported");
}

void RecordBuilder::Body::setMemento(const Fn::Package&) {
    FN_THROW(FNEBadFunCall, "Recordbuilder::setMemento not supported");
}

} // namespace Cmp
