#pragma once

#include "cmp/stored_features.h"

namespace Cmp::Implementation {

/// From the features of one generation to records of theirs and back. Immutable.
///
/// @tparam Generation what tells its records from those of others, see FeatureSet
/// @tparam Encoder has mementoSize(), encode(feature, memory), and decode(memory, feature) for each class of
/// features that is asked for
template <class Generation, class Encoder> class EncodedRecords {
public:
    using Record = FeatureSet<Generation>;

    /// @param form without the words, which are what the encoder has behind the header
    EncodedRecords(RecordForm form, const FNCountedPtr<const Encoder>& encoder) : encoder_(encoder) {
        form.words = encoder->mementoSize() / 4 - form.header.size();
        form_ = StoredFeatures::Form(new RecordForm(form));
    }

    const std::string& label() const { return form_->label; }
    const Encoder& encoder() const { return *encoder_; }

    template <class Feature> FIR encode(const std::vector<Feature>& features) const {
        StoredFeatures::Block block(new unsigned char[features.size() * encoder_->mementoSize()]);
        unsigned char* memory = block.get();
        for (const Feature& feature : features) {
            encoder_->encode(feature, memory);
            memory += encoder_->mementoSize();
        }
        return fir(new Record(form_, std::move(block), features.size()));
    }
    /// @throws FNEBadArg for a package of another label or form
    FIR read(const Fn::Package& package) const { return fir(new Record(form_, package)); }
    FIR read(Fn::PackageView::Bytes package) const { return fir(new Record(form_, package)); }
    FIR read(unsigned char*& memory) const { return fir(new Record(form_, memory)); }

    /// @throws std::bad_cast for a record of another generation; FNEBadArg for one of other features
    const Record& record(const FIR& fir) const {
        return demandSize(dynamic_cast<const Record&>(*fir.body()));
    }
    /// @throws FNEBadArg for a record of other features
    const Record& demandSize(const Record& record) const {
        if (record.featureSize() != encoder_->mementoSize())
            FN_THROW(FNEBadArg, form_->module + ": record of another length of features");
        return record;
    }
    /// Appends the features of a record. @param room what the encoder makes for one. @throws as record()
    template <class Feature>
    void decode(const FIR& fir, const Feature& room, std::vector<Feature>& features) const {
        const Record& stored = record(fir);
        for (std::size_t i = 0; i < stored.count(); ++i) {
            features.push_back(room);
            encoder_->decode(stored.feature(i), features.back());
        }
    }

private:
    static FIR fir(Record* record) { return FIR(FNCountedPtr<FIR::Body>(record)); }

    FNCountedPtr<const Encoder> encoder_;
    StoredFeatures::Form form_;
};

} // namespace Cmp::Implementation
