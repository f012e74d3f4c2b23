// B7 records: what is accepted is written back to the same in both forms, and any bytes of a feature have the
// same products with others packed as decoded. What a builder's memento holds of samples is read as well.

#include "cmp/b7/sample_selection.h"
#include "cmp/encoded_records.h"

#include <cstdlib>
#include <cstring>

namespace {

using namespace Cmp::B7;
struct Generation;
using Records = Cmp::Implementation::EncodedRecords<Generation, Encoder>;

const Records& records() {
    using Cmp::Implementation::RecordForm;
    using Field = RecordForm::Field;
    static const Records instance(
        RecordForm{"B7-0 FIR11.0", "PCLD", {Field::Float, Field::Float, Field::Float}},
        FNCountedPtr<const Encoder>(new Encoder));
    return instance;
}

void compare(const Records::Record& record) {
    const Encoder& encoder = records().encoder();
    for (std::size_t i = 0; i + 1 < record.count(); ++i) {
        const unsigned char *const a = record.feature(i), *const b = record.feature(i + 1);
        FixedPointFeature x = encoder.createRawFixedType(), y = encoder.createRawFixedType();
        encoder.decode(a, x);
        encoder.decode(b, y);
        const PackedProducts& products = encoder.packedProducts();
        const unsigned char* const codes = a + Encoder::headerSize;
        PackedProducts::Sums sums;
        products.sums(b + Encoder::headerSize, products.prepare({&codes, 1}), &sums);
        if (encoder.product(sums) != encoder.wordDotProduct(x.vector.get(), y.vector.get())) std::abort();
    }
}

void readPackage(const Fn::Package& package) {
    try {
        const Cmp::FIR fir = records().read(package);
        const Records::Record& record = records().record(fir);
        compare(record);
        const Fn::Package written = fir.serialize();
        if (!(records().read(written).serialize() == written)) std::abort();
    } catch (const FNException&) {
    }
    try {
        SampleSelection selection{SampleSelector()};
        const FNPair<SampleSelection::Samples, SampleSelection::Qualities> parts(package);
        selection.restore(parts.first, parts.second);
        if (selection.size() != parts.first.size()) std::abort();
        if (!selection.qualities().empty()) (void)selection.best();
    } catch (const FNException&) {
    }
}

/// The flat form trusts its count: it is given one that is true.
void readFlat(const unsigned char* data, std::size_t size) {
    const std::size_t feature = records().encoder().mementoSize();
    const auto count = static_cast<std::uint32_t>(size / feature);
    std::vector<unsigned char> flat(sizeof count + count * feature);
    std::memcpy(flat.data(), &count, sizeof count);
    if (count != 0) std::memcpy(flat.data() + sizeof count, data, count * feature);
    unsigned char* memory = flat.data();
    const Cmp::FIR fir = records().read(memory);
    if (memory != flat.data() + flat.size() || fir.mementoSize() != flat.size()) std::abort();
    compare(records().record(fir));
    std::vector<unsigned char> written(flat.size());
    memory = written.data();
    fir.createMemento(memory);
    if (written != flat) std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    readFlat(data, size);
    try {
        readPackage(Fn::Package(data, size));
    } catch (const FNException&) {
    }
    return 0;
}
