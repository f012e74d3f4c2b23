#pragma once

#include "cmp/gallery_walk.h"
#include "cmp/strategy.h"

/// A generation for tests of the frame: a record is a number, and two records score the higher the nearer
/// they are.
namespace NumberRecords {

class Record final : public Cmp::FIR::Body {
public:
    explicit Record(float number) : value(number) {}
    Fn::Package serialize() const override { return Fn::Package(value); }
    void createMemento(unsigned char*&) const override {}
    std::size_t mementoSize() const override { return 4; }
    std::string version() const override { return "number"; }

    const float value;
};

inline Cmp::FIR record(float number) {
    return Cmp::FIR(FNCountedPtr<Cmp::FIR::Body>(new Record(number)));
}

inline float score(float a, float b) {
    return 1 - std::abs(a - b);
}

/// Counts scores in ten bins if it is told to, and takes two records at once.
class Comparer {
public:
    using Record = NumberRecords::Record;
    using Item = Cmp::Implementation::GalleryIterator::Item;

    Comparer(const std::vector<float>& probes, bool counts)
        : probes_(probes), distributions_(counts ? probes.size() : 0, Cmp::ScoreHistogram(10, 0u)) {}

    std::size_t itemsAtOnce() const { return 2; }
    void load(std::size_t slot, const Record& loaded) { loaded_[slot] = loaded.value; }
    void compare(std::span<Item> items) {
        for (std::size_t i = 0; i < items.size(); ++i)
            for (std::size_t p = 0; p < probes_.size(); ++p) {
                items[i].scores[p] = score(probes_[p], loaded_[i]);
                if (!distributions_.empty())
                    ++distributions_[p][static_cast<std::size_t>(
                        std::clamp(items[i].scores[p] * 10, 0.0f, 9.0f))];
            }
    }
    const std::vector<Cmp::ScoreHistogram>* distributions() const {
        return distributions_.empty() ? nullptr : &distributions_;
    }

private:
    std::vector<float> probes_;
    std::vector<Cmp::ScoreHistogram> distributions_;
    float loaded_[2] = {};
};

class Algorithm : public Cmp::Implementation::ComparisonAlgorithm {
public:
    explicit Algorithm(bool counts = false) : counts_(counts) {}

    std::string name() const override { return "number"; }
    Cmp::Sample::Requirements sampleRequirements() const override { return {}; }
    Cmp::RecordBuilder createRecordBuilder() const override { return Cmp::RecordBuilder({}); }
    Cmp::FIR merge(const std::list<Cmp::FIR>&, const Cmp::FIR& added) const override { return added; }
    float one2one(const Cmp::FIR& first, const Cmp::FIR& second) const override {
        return score(valueOf(first), valueOf(second));
    }
    Cmp::Population createPopulation(unsigned int capacity) const override {
        return Cmp::Population(FNCountedPtr<Cmp::Population::Body>(new Cmp::FeatureSets<Record>(capacity)));
    }
    std::list<Cmp::Implementation::GalleryIterator>
    prepareFew2Many(const std::vector<Cmp::FIR>& probes,
                    const Fn::View<Cmp::Population>::Iterator& populations,
                    unsigned int partitions) const override {
        std::vector<float> values;
        for (const Cmp::FIR& probe : probes) values.push_back(valueOf(probe));
        return Cmp::Implementation::walkGallery(populations, partitions, probes.size(),
                                                Comparer(values, counts_), "Number");
    }

private:
    static float valueOf(const Cmp::FIR& fir) { return dynamic_cast<const Record&>(*fir.body()).value; }

    bool counts_;
};

inline Cmp::Strategy strategy(unsigned int threads, const FNCountedPtr<Algorithm>& algorithm) {
    using namespace Cmp::Implementation;
    return {algorithm, FNCountedPtr<ScoreMapping>(new IdentityScoreMapping), FNCountedPtr<RatesMapping>(),
            threads};
}

} // namespace NumberRecords
