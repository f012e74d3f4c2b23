#pragma once

#include "cmp/fir.h"
#include "fn/serialize.h"

#include <span>
#include <vector>

namespace Cmp::Implementation {

/// How the features of one generation lie in its records.
///
/// In memory a feature is a block of bytes: the header's fields of 4 bytes each, and words of 32 bits, all in
/// the order of bytes of the machine; the features of a record lie back to back. In a package a record is a
/// list of the label with "::RefSet" behind it, and a list for each feature: the fields, and a vector of int
/// with the words.
struct RecordForm {
    enum class Field { Int, UInt, Float };

    std::string label;
    std::string module; ///< begins the texts of failures
    std::vector<Field> header;
    std::size_t words = 0; ///< of a feature, without the header

    std::size_t featureSize() const { return 4 * (header.size() + words); }
};

/// The features of a record.
class StoredFeatures : public FIR::Body {
public:
    using Form = FNCountedPtr<const RecordForm>;
    using Block = FNRMem<unsigned char>;

    /// @param features a whole number of features
    StoredFeatures(const Form& form, const Block& features) : form_(form), features_(features) {}
    /// @throws FNEBadArg for another label, or features that do not have the form
    StoredFeatures(const Form& form, const Fn::Package& package);
    /// The flat form at `memory`, which is moved behind it and must outlive this.
    StoredFeatures(const Form& form, unsigned char*& memory);

    Fn::Package serialize() const override;
    void createMemento(unsigned char*& memory) const override;
    std::size_t mementoSize() const override { return 4 + features_.size(); }
    std::string version() const override { return form_->label; }

    std::size_t count() const { return features_.size() / form_->featureSize(); }
    std::size_t featureSize() const { return form_->featureSize(); }
    const unsigned char* feature(std::size_t i) const { return features_.data() + i * form_->featureSize(); }

private:
    Form form_;
    Block features_;
};

/// The records of one generation, which cannot be taken for those of another.
template <class Generation> class FeatureSet final : public StoredFeatures {
public:
    using StoredFeatures::StoredFeatures;
};

} // namespace Cmp::Implementation
