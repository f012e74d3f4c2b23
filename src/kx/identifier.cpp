#include "kx/identifier.h"

#include "kx/recognizer.h"

namespace Kx::Implementation {

bool Identifier::compare(const SensorSample& sample) {
    const std::optional<Cmp::FIR> record = recordOf(strategy_, sample.cmpSample());
    if (!record) return false;
    matches_ = *strategy_.compare({{*record, threshold_, maxMatches_}}, populations_.begin()).front();
    return !matches_.empty();
}

} // namespace Kx::Implementation
