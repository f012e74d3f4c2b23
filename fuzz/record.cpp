// Records from packages: what is accepted is of the right label and size, and is written back to the same in
// both forms.

#include "cmp/stored_features.h"

#include <cstdlib>

namespace {

using namespace Cmp::Implementation;

void read(const StoredFeatures::Form& form, const Fn::Package& package) {
    struct Generation;
    using Record = FeatureSet<Generation>;
    try {
        const Record record(form, package);
        if (record.mementoSize() != 4 + record.count() * record.featureSize()) std::abort();
        const Fn::Package written = record.serialize();
        if (!(Record(form, written).serialize() == written)) std::abort();
        std::vector<unsigned char> flat(record.mementoSize());
        unsigned char* memory = flat.data();
        record.createMemento(memory);
        memory = flat.data();
        if (!(Record(form, memory).serialize() == written)) std::abort();
    } catch (const FNException&) {
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    using Field = RecordForm::Field;
    static const StoredFeatures::Form floats(
        new RecordForm{"F 1", "PCLD", {Field::Float, Field::Float, Field::Float}, 3});
    static const StoredFeatures::Form integers(
        new RecordForm{"I 1", "CmpAlgorithm", {Field::Int, Field::UInt, Field::Int, Field::Float}, 2});
    try {
        const Fn::Package package(data, size);
        read(floats, package);
        read(integers, package);
    } catch (const FNException&) {
    }
    return 0;
}
