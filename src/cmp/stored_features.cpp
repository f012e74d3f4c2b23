#include "cmp/stored_features.h"

#include "fn/vector.h"

#include <algorithm>
#include <cstring>

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

void unpackField(Field field, Fn::PackageReader& reader, unsigned char* memory) {
    const auto put = [&](auto value) { std::memcpy(memory, &value, sizeof value); };
    switch (field) {
    case Field::Int:
        return put(reader.next<int>());
    case Field::UInt:
        return put(reader.next<unsigned int>());
    case Field::Float:
        return put(reader.next<float>());
    }
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

void unpackFeature(const RecordForm& form, const Fn::Package& package, unsigned char* memory) {
    Fn::PackageReader reader(package);
    for (const Field field : form.header) {
        unpackField(field, reader, memory);
        memory += 4;
    }
    const auto words = reader.next<Words>();
    reader.expectEnd();
    if (words.size() != form.words)
        FN_THROW(FNEBadArg, form.module + ": loadFeatureSet: incompatible data: " + form.label +
                                ": feature of " + std::to_string(words.size()) + " words instead of " +
                                std::to_string(form.words));
    if (form.words != 0) std::memcpy(memory, words.get(), form.words * 4);
}

/// The children of a record's package.
std::list<Fn::Package> children(const RecordForm& form, const Fn::Package& package) {
    std::list<Fn::Package> result;
    try {
        result = package;
    } catch (const FNEBadArg&) { // no list: told below
    }
    if (result.empty()) FN_THROW(FNEBadArg, form.module + ": loadrefSet: incompatible data");
    return result;
}

std::string labelOf(const RecordForm& form) {
    return form.label + "::RefSet";
}

/// Features back to back.
std::vector<unsigned char> read(const RecordForm& form, const Fn::Package& package) {
    const std::list<Fn::Package> all = children(form, package);
    const auto label = Fn::deSerialize<std::string>(all.front());
    if (label != labelOf(form))
        FN_THROW(FNEBadArg,
                 form.module + ": loadFeatureSet: incompatible data: wrong version [" + label + "]");
    std::vector<unsigned char> features; // grows with what is there: a list may have many empty children
    for (auto feature = std::next(all.begin()); feature != all.end(); ++feature) {
        features.resize(features.size() + form.featureSize());
        unpackFeature(form, *feature, features.data() + features.size() - form.featureSize());
    }
    return features;
}

} // namespace

StoredFeatures::StoredFeatures(const Form& form, const Fn::Package& package)
    : form_(form), features_(nullptr), count_(0), owns_(true) {
    const std::vector<unsigned char> features = read(*form, package);
    if (features.empty()) return;
    auto* const block = new unsigned char[features.size()];
    std::ranges::copy(features, block);
    features_ = block;
    count_ = static_cast<std::uint32_t>(features.size() / featureSize());
}

StoredFeatures::StoredFeatures(const Form& form, unsigned char*& memory)
    : form_(form), features_(memory + sizeof count_), count_(0), owns_(false) {
    std::memcpy(&count_, memory, sizeof count_);
    memory += mementoSize();
}

StoredFeatures::~StoredFeatures() {
    if (owns_) delete[] features_;
}

Fn::Package StoredFeatures::serialize() const {
    std::list<Fn::Package> elements{Fn::serialize(labelOf(*form_))};
    for (std::size_t i = 0; i < count(); ++i) elements.push_back(packFeature(*form_, feature(i)));
    return Fn::Package(elements);
}

void StoredFeatures::createMemento(unsigned char*& memory) const {
    std::memcpy(memory, &count_, sizeof count_);
    if (count_ != 0) std::memcpy(memory + sizeof count_, features_, size());
    memory += mementoSize();
}

} // namespace Cmp::Implementation
