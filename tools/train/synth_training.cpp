#include "train/synth_training.h"

#include "fn/exception.h"
#include "fn/matrix_eigen.h"
#include "fn/numeric/blas.h"
#include "fn/numeric/lapack.h"
#include "train/synth_samples.h"

#include <algorithm>
#include <cmath>
#include <iostream>
#include <sstream>

#include <zlib.h>

namespace Train {
namespace {

using Fn::Numeric::Blas;
using Fn::Numeric::Lapack;
using Synth::controlCount;
using Synth::shapeSize;

constexpr std::size_t identityCount = 100;
/// Share of the faces that is left out because the model explains them least: glasses, hands, strong shadows.
constexpr double shareLeftOut = 0.25;
/// Mean Cr of the cheeks; below it a photo is grey.
constexpr float leastRed = 136;
/// Components that judge this.
constexpr std::size_t judgeCount = 40;
/// How much the shape counts against the texture, as share of its total variance.
constexpr float shapeShare = 0.6f;

const std::vector<FaceChoice> genderFrom = {{"portraits/mtfl", 24}};

/// Samples as columns of one matrix.
struct Columns {
    std::size_t rows = 0;
    std::vector<float> values;
    std::vector<Synth::Controls> controls;

    std::size_t count() const { return controls.size(); }
    float* column(std::size_t i) { return values.data() + i * rows; }
    const float* column(std::size_t i) const { return values.data() + i * rows; }
    void add(const SynthSample& sample) {
        rows = sample.values.size();
        values.insert(values.end(), sample.values.begin(), sample.values.end());
        controls.push_back(sample.controls);
    }
    /// Takes the mean of each face and its mirror image, which follow each other.
    void symmetrise() {
        for (std::size_t i = 0; i + 1 < count(); i += 2)
            for (std::size_t k = 0; k < rows; ++k) column(i / 2)[k] = (column(i)[k] + column(i + 1)[k]) / 2;
        controls.resize(count() / 2);
        values.resize(count() * rows);
    }
    /// Keeps the columns for which the flag is set.
    void keep(const std::vector<char>& flags) {
        std::size_t n = 0;
        for (std::size_t i = 0; i < count(); ++i) {
            if (!flags[i]) continue;
            std::copy_n(column(i), rows, column(n));
            controls[n++] = controls[i];
        }
        controls.resize(n);
        values.resize(n * rows);
    }
};

/// Takes faces of gray photos off the list.
Columns load(std::vector<PointedFace>& faces, const PhotoWarper& warper, HairRemoval& hair, bool learn) {
    std::vector<SynthSample> samples;
    std::vector<PointedFace> used;
    for (const PointedFace& face : faces) {
        auto [sample, mirror] = warper.samples(face);
        if (sample.controls[Synth::tintRed] < leastRed) continue;
        samples.push_back(std::move(sample));
        samples.push_back(std::move(mirror));
        used.push_back(face);
    }
    faces = std::move(used);
    if (learn) hair.learn(samples);
    Columns columns;
    columns.values.reserve(samples.size() * samples.front().values.size());
    for (SynthSample& sample : samples) {
        hair.apply(sample);
        columns.add(sample);
        sample.values = {};
    }
    return columns;
}

/// Mean, and what a standard deviation of each control does to a face.
struct ControlModel {
    std::vector<float> mean;
    Synth::Controls controlMean{}, controlDeviation{};
    std::vector<float> directions; ///< a column for each control

    explicit ControlModel(const Columns& columns);
    /// The columns less all of this.
    void removeFrom(Columns& columns) const;
    std::vector<float> standardised(const Columns& columns) const;
};

/// Rows are the controls, columns the samples.
std::vector<float> ControlModel::standardised(const Columns& columns) const {
    constexpr float most = 3;
    std::vector<float> result;
    for (const Synth::Controls& controls : columns.controls)
        for (std::size_t c = 0; c < controlCount; ++c)
            result.push_back(std::clamp((controls[c] - controlMean[c]) / controlDeviation[c], -most, most));
    return result;
}

ControlModel::ControlModel(const Columns& columns)
    : mean(columns.rows), directions(columns.rows * controlCount) {
    const auto n = static_cast<float>(columns.count());
    for (std::size_t i = 0; i < columns.count(); ++i) {
        Blas<float>::axpy(columns.rows, 1 / n, columns.column(i), mean.data());
        for (std::size_t c = 0; c < controlCount; ++c) controlMean[c] += columns.controls[i][c] / n;
    }
    for (const Synth::Controls& controls : columns.controls)
        for (std::size_t c = 0; c < controlCount; ++c)
            controlDeviation[c] += (controls[c] - controlMean[c]) * (controls[c] - controlMean[c]) / n;
    for (float& deviation : controlDeviation) deviation = std::sqrt(deviation);

    // Least squares: directions = Y Z' (Z Z')^-1, where the mean of Y falls out as the rows of Z sum to 0.
    const std::vector<float> z = standardised(columns);
    std::vector<float> covariance(controlCount * controlCount), unit(covariance.size());
    Blas<float>::gemm(false, true, controlCount, controlCount, columns.count(), 1, z.data(), z.data(), 0,
                      covariance.data());
    for (std::size_t c = 0; c < controlCount; ++c) unit[c * (controlCount + 1)] = 1;
    int pivots[controlCount];
    if (Lapack<float>::gesv(controlCount, controlCount, covariance.data(), pivots, unit.data()) != 0)
        FN_THROW(FNEBadArg, "The faces do not vary in pose, expression and light");
    std::vector<float> products(directions.size());
    Blas<float>::gemm(false, true, columns.rows, controlCount, columns.count(), 1, columns.values.data(),
                      z.data(), 0, products.data());
    std::vector<float> sums(controlCount);
    for (std::size_t i = 0; i < z.size(); ++i) sums[i % controlCount] += z[i];
    Blas<float>::ger(columns.rows, controlCount, -1, mean.data(), sums.data(), products.data());
    Blas<float>::gemm(false, false, columns.rows, controlCount, controlCount, 1, products.data(), unit.data(),
                      0, directions.data());
}

void ControlModel::removeFrom(Columns& columns) const {
    const std::vector<float> z = standardised(columns);
    Blas<float>::gemm(false, false, columns.rows, columns.count(), controlCount, -1, directions.data(),
                      z.data(), 1, columns.values.data());
    for (std::size_t i = 0; i < columns.count(); ++i)
        Blas<float>::axpy(columns.rows, -1, mean.data(), columns.column(i));
}

/// Scales the shape part of all columns.
void scaleShapes(Columns& columns, float factor) {
    for (std::size_t i = 0; i < columns.count(); ++i)
        Blas<float>::scal(shapeSize, factor, columns.column(i), 1);
}

float shapeWeight(const Columns& columns) {
    double shape = 0, texture = 0;
    for (std::size_t i = 0; i < columns.count(); ++i) {
        const float* const column = columns.column(i);
        for (std::size_t k = 0; k < columns.rows; ++k)
            (k < shapeSize ? shape : texture) += double{column[k]} * column[k];
    }
    return static_cast<float>(std::sqrt(shapeShare * texture / shape));
}

/// The directions of greatest variance, as columns one standard deviation long.
struct Components {
    std::size_t count;
    std::vector<float> directions;
    std::vector<float> deviations;
    std::vector<float> unexplained; ///< share of each sample's square that lies outside of them
};

Components principalComponents(const Columns& columns, std::size_t count) {
    const std::size_t n = columns.count();
    if (n < 2 * count) FN_THROW(FNEBadArg, "There are too few faces: " + std::to_string(n));
    Fn::SymmMatrix<float> gram(n);
    Blas<float>::gemm(true, false, n, n, columns.rows, 1 / static_cast<float>(n), columns.values.data(),
                      columns.values.data(), 0, gram.getExclusive());
    std::vector<float> squares(n);
    for (std::size_t i = 0; i < n; ++i) squares[i] = gram(i, i);
    Fn::Matrix<float> vectors(n, count);
    const FNVector<float> values = Fn::eigenVectorsLowMem(gram, vectors, true, static_cast<int>(count));
    Components result{count, std::vector<float>(columns.rows * count), {}, std::vector<float>(n)};
    std::vector<float> ordered; // the vectors as columns, those of the largest values first
    for (std::size_t k = count; k-- > 0;) {
        const float* const vector = vectors.get() + k * n;
        ordered.insert(ordered.end(), vector, vector + n);
        result.deviations.push_back(std::sqrt(std::max(0.0f, values.get()[k])));
    }
    Blas<float>::gemm(false, false, columns.rows, count, n, 1 / std::sqrt(static_cast<float>(n)),
                      columns.values.data(), ordered.data(), 0, result.directions.data());
    for (std::size_t i = 0; i < n; ++i) {
        float explained = 0;
        for (std::size_t k = 0; k < count; ++k) {
            const float part = result.deviations[k] * ordered[k * n + i];
            explained += part * part;
        }
        result.unexplained[i] = 1 - explained / squares[i];
    }
    return result;
}

/// Half the mean difference of women and men, in standard deviations of each component.
std::vector<float> feminine(const Columns& columns, const std::vector<PointedFace>& faces,
                            const Components& components) {
    std::vector<float> difference(columns.rows);
    std::size_t women = 0, men = 0;
    for (const PointedFace& face : faces) ++(face.gender == "f" ? women : men);
    for (std::size_t i = 0; i < columns.count(); ++i) {
        const bool woman = faces[i].gender == "f";
        const float weight = 0.5f / static_cast<float>(woman ? women : men);
        Blas<float>::axpy(columns.rows, woman ? weight : -weight, columns.column(i), difference.data());
    }
    std::vector<float> result(components.count);
    Blas<float>::gemv(true, columns.rows, components.count, 1, components.directions.data(),
                      difference.data(), 0, result.data());
    for (std::size_t k = 0; k < result.size(); ++k)
        result[k] /= components.deviations[k] * components.deviations[k];
    return result;
}

std::vector<Synth::Direction> directionsOf(const std::vector<float>& columns, std::size_t rows,
                                           float shapeFactor) {
    std::vector<Synth::Direction> result;
    for (std::size_t i = 0; i < columns.size(); i += rows) {
        std::vector<float> values(columns.begin() + static_cast<std::ptrdiff_t>(i),
                                  columns.begin() + static_cast<std::ptrdiff_t>(i + rows));
        Blas<float>::scal(shapeSize, shapeFactor, values.data(), 1);
        result.emplace_back(std::span<const float>(values));
    }
    return result;
}

void writeCompressed(const Synth::PortraitModel& model, const std::filesystem::path& path) {
    std::ostringstream bytes;
    Fn::Package(model).write(bytes);
    const std::string text = bytes.str();
    const gzFile file = gzopen(path.c_str(), "wb9");
    const bool written = file && gzwrite(file, text.data(), static_cast<unsigned>(text.size())) ==
                                     static_cast<int>(text.size());
    if (!file || gzclose(file) != Z_OK || !written) FN_THROW(FNEIOError, "Cannot write " + path.string());
}

} // namespace

void trainSynth(const std::filesystem::path& data, const std::filesystem::path& out, std::uint64_t) {
    std::vector<PointedFace> faces = pointedFaces(data, Labelled::Split::train, synthPhotos());
    const Synth::Points landmarks = meanShape(faces, synthEyeDistance);
    const Synth::TextureFrame frame(landmarks);
    std::cout << faces.size() << " faces, " << frame.w() << "x" << frame.h() << " pixels" << std::endl;
    const PhotoWarper warper(frame);
    HairRemoval hair(frame);
    Columns columns = load(faces, warper, hair, true);

    Columns judged = columns;
    ControlModel(judged).removeFrom(judged);
    scaleShapes(judged, shapeWeight(judged));
    judged.symmetrise();
    std::vector<float> unexplained = principalComponents(judged, judgeCount).unexplained,
                       sorted = unexplained;
    judged = {};
    const auto limit =
        sorted.begin() + static_cast<std::ptrdiff_t>(static_cast<double>(sorted.size()) * (1 - shareLeftOut));
    std::nth_element(sorted.begin(), limit, sorted.end());
    std::vector<char> kept;
    for (const float share : unexplained) kept.insert(kept.end(), 2, share < *limit);
    columns.keep(kept);
    std::cout << columns.count() / 2 << " faces kept" << std::endl;

    const ControlModel controls(columns);
    controls.removeFrom(columns);
    columns.symmetrise(); // a face's own asymmetry cannot be told from pose and light
    const float weight = shapeWeight(columns);
    scaleShapes(columns, weight);
    const Components components = principalComponents(columns, identityCount);
    double total = 0, explained = 0;
    for (const float value : columns.values) total += double{value} * value;
    for (const float deviation : components.deviations) explained += double{deviation} * deviation;
    std::cout << "components explain " << 100 * explained * static_cast<double>(columns.count()) / total
              << " % of what is not pose, expression or light" << std::endl;

    std::vector<PointedFace> gendered = pointedFaces(data, Labelled::Split::train, genderFrom);
    Columns genderColumns = load(gendered, warper, hair, false);
    controls.removeFrom(genderColumns);
    genderColumns.symmetrise();
    scaleShapes(genderColumns, weight);

    const Synth::PortraitModel model(landmarks, controls.mean,
                                     directionsOf(controls.directions, columns.rows, 1),
                                     directionsOf(components.directions, columns.rows, 1 / weight),
                                     feminine(genderColumns, gendered, components));
    std::filesystem::create_directories(out);
    writeCompressed(model, out / "portrait.dat.gz");
}

} // namespace Train
