#pragma once

#include "cmp/fir.h"
#include "fn/package_view.h"
#include "fn/serialize.h"

#include <cstdint>
#include <memory>
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
    using Block = std::unique_ptr<unsigned char[]>;

    /// @param features so many, back to back
    StoredFeatures(const Form& form, Block features, std::size_t count)
        : form_(form), features_(features.release()), count_(static_cast<std::uint32_t>(count)), owns_(true) {
    }
    /// @param package its bytes
    /// @throws FNEBadArg for bytes that are no package, another label, or features that do not have the form
    StoredFeatures(const Form& form, Fn::PackageView::Bytes package);
    StoredFeatures(const Form& form, const Fn::Package& package);
    /// The flat form at `memory`, which is moved behind it and must outlive this.
    StoredFeatures(const Form& form, unsigned char*& memory);
    ~StoredFeatures() override;
    StoredFeatures(const StoredFeatures&) = delete;
    StoredFeatures& operator=(const StoredFeatures&) = delete;

    Fn::Package serialize() const override;
    void createMemento(unsigned char*& memory) const override;
    std::size_t mementoSize() const override { return 4 + size(); }
    std::string version() const override { return form_->label; }

    std::size_t count() const { return count_; }
    std::size_t featureSize() const { return form_.get()->featureSize(); }
    const unsigned char* feature(std::size_t i) const { return features_ + i * featureSize(); }

private:
    std::size_t size() const { return count_ * featureSize(); }

    // A gallery has very many of these: not a byte more than it takes.
    Form form_;
    const unsigned char* features_;
    std::uint32_t count_;
    bool owns_; ///< whether the features are deleted with this
};

/// The records of one generation, which cannot be taken for those of another.
template <class Generation> class FeatureSet final : public StoredFeatures {
public:
    using StoredFeatures::StoredFeatures;
};

} // namespace Cmp::Implementation
