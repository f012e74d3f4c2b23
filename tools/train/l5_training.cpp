#include "train/l5_training.h"

#include "cmp/pcld/pcld.h"
#include "fn/imagefile/image_file.h"
#include "fn/matrix_eigen.h"
#include "labelled/labels.h"
#include "train/calibration.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <iostream>
#include <random>

namespace Train {

namespace {

using Cmp::Pcld::Transformation;

constexpr std::size_t mainDirections = 600;
constexpr std::size_t components = 256;
constexpr std::size_t mostImages[] = {8000, 1500, 1500}; ///< of the train, dev and test part
constexpr std::size_t mostPerPerson = 20;

/// Raw vectors of images of known persons; images of one person stand together.
struct RawVectors {
    Fn::Matrix<float> columns{0, 0};
    std::vector<std::string> persons; ///< of each column
};

std::vector<Labelled::Row> rowsOf(const std::filesystem::path& data, Labelled::Split split,
                                  std::uint64_t seed) {
    std::map<std::string, std::vector<Labelled::Row>> people;
    for (const char* folder : {"people/lfw", "people/celeba"})
        for (const Labelled::Row& row : Labelled::readLabels(data / folder / "labels.tsv")) {
            const std::string person = row.text("person");
            const auto left = row.position("eye_left"), right = row.position("eye_right");
            if (person.empty() || !left || !right || !(left->x < right->x)) continue;
            auto& images = people[person];
            if (Labelled::splitOf(row.splitKey()) == split && images.size() < mostPerPerson)
                images.push_back(row);
        }
    std::vector<std::string> names;
    for (const auto& [name, images] : people)
        if (images.size() > 1) names.push_back(name);
    std::mt19937_64 random(seed);
    std::shuffle(names.begin(), names.end(), random);
    std::vector<Labelled::Row> rows;
    for (const std::string& name : names) {
        if (rows.size() >= mostImages[static_cast<std::size_t>(split)]) break;
        rows.insert(rows.end(), people[name].begin(), people[name].end());
    }
    return rows;
}

RawVectors extract(const std::vector<Labelled::Row>& rows) {
    const Cmp::Pcld::GaborPyrRankNormProcessor processor(Cmp::Implementation::l5Params('x'));
    RawVectors raw{Fn::Matrix<float>(processor.featureSize(), rows.size()), {}};
    float* out = raw.columns.getExclusive();
    for (const Labelled::Row& row : rows) {
        const FNVector<float> vector = processor(Cmp::Implementation::l5Face(
            Fn::readImage(row.image().string()), *row.position("eye_left"), *row.position("eye_right")));
        out = std::ranges::copy(vector, out).out;
        raw.persons.push_back(row.text("person"));
    }
    return raw;
}

FNVector<float> meanOf(const Fn::Matrix<float>& columns) {
    FNVector<float> mean(columns.rows(), 0.0f);
    for (std::size_t c = 0; c < columns.cols(); ++c)
        mean.linear_add(1 / static_cast<float>(columns.cols()), columns.column(c));
    return mean;
}

/// The difference of each column and the mean of the `groups` that it belongs to.
Fn::Matrix<float> centred(const Fn::Matrix<float>& columns, const std::vector<std::string>& groups) {
    Fn::Matrix<float> result(columns.rows(), columns.cols());
    for (std::size_t begin = 0, end = 0; begin < columns.cols(); begin = end) {
        while (end < columns.cols() && groups[end] == groups[begin]) ++end;
        FNVector<float> mean(columns.rows(), 0.0f);
        for (std::size_t c = begin; c < end; ++c)
            mean.linear_add(1 / static_cast<float>(end - begin), columns.column(c));
        for (std::size_t c = begin; c < end; ++c) result.column(c, columns.column(c) - mean);
    }
    return result;
}

Fn::SymmMatrix<float> covariance(const Fn::Matrix<float>& centredColumns) {
    Fn::SymmMatrix<float> result(centredColumns.rows());
    result = 0.0f;
    result.addOuterProducts(centredColumns);
    result *= 1 / static_cast<float>(centredColumns.cols());
    return result;
}

/// Directions in which persons differ, measured by how much images of one person do.
Transformation train(const RawVectors& raw) {
    const FNVector<float> average = meanOf(raw.columns);
    const Fn::Matrix<float> all = centred(raw.columns, std::vector<std::string>(raw.persons.size()));
    Fn::SymmMatrix<float> total = covariance(all);
    Fn::Matrix<float> directions(all.rows(), mainDirections);
    Fn::eigenVectorsLowMem(total, directions, true, static_cast<int>(mainDirections));

    const Fn::Matrix<float> main = directions.transposedMultWith(all);
    Fn::SymmMatrix<float> spread = covariance(main), within = covariance(centred(main, raw.persons));
    float trace = 0;
    for (std::size_t i = 0; i < mainDirections; ++i) trace += within(i, i);
    for (std::size_t i = 0; i < mainDirections; ++i) within(i, i) += trace / mainDirections;
    Fn::Matrix<float> best(mainDirections, components);
    Fn::generalizedEigenVectorsLowMem(spread, within, best, true, static_cast<int>(components));
    return {directions * best, average};
}

ComparisonScores compare(const Transformation& transformation, const RawVectors& raw) {
    std::vector<Cmp::Pcld::FloatingPointFeature> features;
    for (std::size_t c = 0; c < raw.columns.cols(); ++c)
        features.emplace_back(transformation(raw.columns.column(c)), nullptr, false);
    ComparisonScores scores;
    for (std::size_t a = 0; a < features.size(); ++a)
        for (std::size_t b = 0; b < a; ++b)
            (raw.persons[a] == raw.persons[b] ? scores.genuine : scores.impostor)
                .push_back(features[a].vector * features[b].vector);
    return scores;
}

} // namespace

void trainL5(const std::filesystem::path& data, const std::filesystem::path& folder, std::uint64_t seed) {
    std::filesystem::create_directories(folder);
    const auto load = [&](Labelled::Split split) { return extract(rowsOf(data, split, seed)); };
    const RawVectors learned = load(Labelled::Split::train);
    std::cout << learned.persons.size() << " images to learn from\n" << std::flush;
    const Transformation transformation = train(learned);
    transformation.write((folder / "trans-l5x.dat").string());

    const Calibration calibration(compare(transformation, load(Labelled::Split::dev)));
    writeCalibration(calibration, "b5l5", folder);
    std::cout << "On dev, where it is calibrated: ";
    calibration.report(std::cout);
    std::cout << "\nOn test: ";
    Calibration(compare(transformation, load(Labelled::Split::test))).report(std::cout);
}

} // namespace Train
