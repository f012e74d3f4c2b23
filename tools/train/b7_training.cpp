#include "train/b7_training.h"

#include "cmp/b7/encoder.h"
#include "cmp/b7/preprocessor.h"
#include "cmp/b7/score_normalization.h"
#include "cmp/b7/transformation.h"
#include "cmp/b7/value_histogram.h"
#include "train/b7_projection.h"
#include "train/calibration.h"

#include <algorithm>
#include <fstream>
#include <iostream>
#include <sstream>

#include <zlib.h>

namespace Train {
namespace {

using Cmp::B7::FixedPointFeature;
using Labelled::Split;

const std::string factorsFile = "trans-b7.dat.factors", transformationFile = "trans-b7.dat";

void writeFactors(const Orbek::Models::B7Factors& factors, const std::filesystem::path& path) {
    std::ostringstream stream;
    factors.write(stream);
    const std::string bytes = stream.str();
    const std::unique_ptr<gzFile_s, decltype(&gzclose)> file(gzopen(path.c_str(), "wb9"), gzclose);
    if (!file || gzwrite(file.get(), bytes.data(), static_cast<unsigned>(bytes.size())) !=
                     static_cast<int>(bytes.size()))
        FN_THROW(FNEIOError, "Cannot write " + path.string());
}

/// Packed features of one set of pictures, as scores see them.
struct Gallery {
    std::vector<FixedPointFeature> features;
    std::vector<std::string> persons;
};

Gallery galleryOf(const RawVectors& raw, const Cmp::B7::Transformation& transformation,
                  const Cmp::B7::Encoder& encoder, const std::string& folder, Split split) {
    Gallery gallery;
    const float step = Cmp::B7::PreProcessor::rankTable.front() / 255;
    for (std::size_t i = 0; i < raw.size(); ++i) {
        const RawVectors::Item& item = raw.item(i);
        if (item.split != split || item.variant != RawVectors::asFound || !item.found ||
            !item.file.starts_with(folder))
            continue;
        FNVector<float> vector(raw.dimension());
        std::ranges::transform(raw.vector(i), vector.getExclusive(),
                               [&](std::uint8_t digit) { return static_cast<float>(digit) * step; });
        auto encoded = encoder.createEncodedType();
        encoder.encode({transformation(vector)}, encoded.data());
        gallery.features.push_back(encoder.createRawFixedType());
        encoder.decode(encoded.data(), gallery.features.back());
        gallery.persons.push_back(item.person);
    }
    return gallery;
}

/// Scores of all pairs. @param plain as they are @param normalized each picture searched among the others
void compare(const Gallery& gallery, const Cmp::B7::Encoder& encoder, ComparisonScores& plain,
             ComparisonScores& normalized) {
    const std::size_t n = gallery.features.size();
    const auto same = [&](std::size_t a, std::size_t b) { return gallery.persons[a] == gallery.persons[b]; };
    for (std::size_t a = 0; a < n; ++a) {
        Cmp::B7::ValueHistogram histogram(Cmp::B7::rawScoreMin, Cmp::B7::rawScoreMax, Cmp::B7::rawScoreBins);
        Cmp::RawMatches matches;
        for (std::size_t b = 0; b < n; ++b) {
            if (a == b) continue;
            const float score =
                encoder.wordDotProduct(gallery.features[a].vector.get(), gallery.features[b].vector.get());
            histogram.add(score);
            matches.insert(Cmp::RawMatch(score, same(a, b) ? "genuine" : "impostor"));
            if (b < a) (same(a, b) ? plain.genuine : plain.impostor).push_back(score);
        }
        for (const Cmp::RawMatch& match : Cmp::B7::normalizeRawScores(matches, histogram.counts()))
            (match.id == "genuine" ? normalized.genuine : normalized.impostor).push_back(match.score);
    }
}

void calibrate(const RawVectors& raw, const Cmp::B7::Transformation& transformation,
               const std::filesystem::path& out) {
    const Cmp::B7::Encoder encoder;
    ComparisonScores plain, normalized;
    for (const char* folder : {"people/lfw", "people/celeba"})
        compare(galleryOf(raw, transformation, encoder, folder, Split::dev), encoder, plain, normalized);
    const Calibration calibration(plain), ofSearches(normalized);
    writeCalibration(calibration, "b7", out);
    writeCalibration(ofSearches, "b7-sn", out);
    std::cout << "On dev, where it is calibrated: ";
    calibration.report(std::cout);
    std::cout << "\nOn dev, normalized by searches: ";
    ofSearches.report(std::cout);
    for (const char* folder : {"people/lfw", "people/celeba"}) {
        ComparisonScores test, testNormalized;
        compare(galleryOf(raw, transformation, encoder, folder, Split::test), encoder, test, testNormalized);
        std::cout << "\nOn test, " << folder << ": ";
        Calibration(test).report(std::cout);
        std::cout << "\nOn test, " << folder << ", normalized by searches: ";
        Calibration(testNormalized).report(std::cout);
    }
}

} // namespace

void trainB7(const TrainingSources& sources, const std::filesystem::path& folder) {
    std::filesystem::create_directories(folder);
    const RawVectors raw(sources);
    std::cout << raw.size() << " raw vectors\n" << std::flush;
    const Orbek::Models::B7Factors factors = learnProjection(raw);
    writeFactors(factors, folder / factorsFile);
    const Cmp::B7::Transformation transformation = factors.unpack();
    transformation.write((folder / transformationFile).string());
    calibrate(raw, transformation, folder);
}

void calibrateB7(const TrainingSources& sources, const std::filesystem::path& folder) {
    const RawVectors raw(sources);
    calibrate(raw,
              Cmp::B7::Transformation::read((folder / transformationFile).string(), raw.dimension(),
                                            Cmp::B7::Encoder().components()),
              folder);
}

} // namespace Train
