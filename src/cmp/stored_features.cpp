#include "cmp/stored_features.h"

#include "fn/byte_order.h"
#include "fn/vector.h"

#include <algorithm>
#include <cstring>
#include <string_view>

namespace Cmp::Implementation {

namespace {

using Field = RecordForm::Field;
using Words = FNVector<int>;

Fn::Package packField(Field field, const unsigned char* memory) {
    const auto as = [&](auto value) {
        std::memcpy(&value, memory, sizeof value);
        return Fn::Package(value);
    };
    return field == Field::Int ? as(int{}) : field == Field::UInt ? as(0u) : as(0.0f);
}

Fn::Package packFeature(const RecordForm& form, const unsigned char* memory) {
    std::list<Fn::Package> elements;
    for (const Field field : form.header) {
        elements.push_back(packField(field, memory));
        memory += 4;
    }
    Words words(form.words);
    if (form.words != 0) std::memcpy(words.getExclusive(), memory, form.words * 4);
    elements.push_back(Fn::serialize(words));
    return Fn::Package(elements);
}

std::vector<unsigned char> bytesOf(const Fn::Package& package) {
    std::vector<unsigned char> bytes(package.size());
    package.write(bytes.data());
    return bytes;
}

constexpr std::string_view labelEnd = "::RefSet";

/// A text with its terminating NUL.
std::string_view textOf(Fn::PackageView package) {
    const auto core = package.count() == 1 ? package.take() : Fn::PackageView::Bytes();
    const auto end = std::ranges::find(core, 0);
    if (end == core.end()) FN_THROW(FNEBadArg, "converting to std::string from invalid package");
    return {reinterpret_cast<const char*>(core.data()), static_cast<std::size_t>(end - core.begin())};
}

/// @param memory room for one feature
void unpackFeature(const RecordForm& form, const Fn::PackageView& package, unsigned char* memory) {
    Fn::PackageListView fields(package);
    for (std::size_t i = 0; i < form.header.size(); ++i, memory += 4) {
        const std::uint32_t value = fields.next().toUInt32();
        std::memcpy(memory, &value, sizeof value);
    }
    Fn::PackageView vector = fields.next();
    if (fields.remaining() != 0) FN_THROW(FNEBadArg, "package has more elements than expected");
    if (vector.count() != 2) FN_THROW(FNEBadArg, "converting to Vector<T> from an invalid package");
    const std::size_t count = vector.first(1).toUInt32();
    vector.skip(1);
    const auto words = vector.take();
    if (words.size() != 4 * count) FN_THROW(FNEBadArg, "T-vector dimensions contradicts packages dimension");
    if (count != form.words)
        FN_THROW(FNEBadArg, form.module + ": loadFeatureSet: incompatible data: " + form.label +
                                ": feature of " + std::to_string(count) + " words instead of " +
                                std::to_string(form.words));
    ntohf(words.data(), reinterpret_cast<float*>(memory), count); // all words of 32 bits are stored alike
}

/// The elements of a record's package.
Fn::PackageListView elements(const RecordForm& form, const Fn::PackageView& package) {
    try {
        if (const Fn::PackageListView list(package); list.remaining() != 0) return list;
    } catch (const FNEBadArg&) { // no list
    }
    FN_THROW(FNEBadArg, form.module + ": loadrefSet: incompatible data");
}

} // namespace

StoredFeatures::StoredFeatures(const Form& form, Fn::PackageView::Bytes bytes)
    : form_(form), features_(nullptr), count_(0), owns_(true) {
    Fn::PackageListView list = elements(*form, Fn::PackageView(bytes));
    const std::string_view label = textOf(list.next());
    if (!label.starts_with(form->label) || label.substr(form->label.size()) != labelEnd)
        FN_THROW(FNEBadArg, form->module + ": loadFeatureSet: incompatible data: wrong version [" +
                                std::string(label) + "]");
    if (list.remaining() == 0) return;
    // Whatever is announced, the bytes hold no more features than that, and the first that is cut short is
    // refused.
    const std::size_t room = std::min(list.remaining(), bytes.size() / featureSize() + 1);
    Block features(new unsigned char[room * featureSize()]);
    for (unsigned char* next = features.get(); list.remaining() != 0; next += featureSize(), ++count_)
        unpackFeature(*form, list.next(), next);
    features_ = features.release();
}

StoredFeatures::StoredFeatures(const Form& form, const Fn::Package& package)
    : StoredFeatures(form, bytesOf(package)) {}

StoredFeatures::StoredFeatures(const Form& form, unsigned char*& memory)
    : form_(form), features_(memory + sizeof count_), count_(0), owns_(false) {
    std::memcpy(&count_, memory, sizeof count_);
    memory += mementoSize();
}

StoredFeatures::~StoredFeatures() {
    if (owns_) delete[] features_;
}

Fn::Package StoredFeatures::serialize() const {
    std::list<Fn::Package> elements{Fn::serialize(form_->label + std::string(labelEnd))};
    for (std::size_t i = 0; i < count(); ++i) elements.push_back(packFeature(*form_, feature(i)));
    return Fn::Package(elements);
}

void StoredFeatures::createMemento(unsigned char*& memory) const {
    std::memcpy(memory, &count_, sizeof count_);
    if (count_ != 0) std::memcpy(memory + sizeof count_, features_, size());
    memory += mementoSize();
}

} // namespace Cmp::Implementation
