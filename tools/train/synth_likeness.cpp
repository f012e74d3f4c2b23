// How like sample portraits are to the photos that their model learned from.

#include "fn/numeric/blas.h"
#include "train/synth_samples.h"
#include "train/synth_training.h"

#include <algorithm>
#include <cmath>
#include <iomanip>
#include <iostream>
#include <limits>

namespace Train {
namespace {

using Fn::Numeric::Blas;

/// Patches as columns.
struct Patches {
    std::size_t rows = 0;
    std::vector<float> values;
    std::vector<std::string> people;
    std::vector<std::string> sets; ///< the folder of each

    std::size_t count() const { return people.size(); }
    void add(const std::vector<float>& patch, const PointedFace& face) {
        rows = patch.size();
        values.insert(values.end(), patch.begin(), patch.end());
        people.push_back(face.person);
        sets.push_back(face.image.parent_path().filename());
    }
    /// To mean 0 and length 1, so that exposure and contrast do not count.
    void normalise() {
        for (std::size_t i = 0; i < count(); ++i) {
            float* const first = values.data() + i * rows;
            float mean = 0, square = 0;
            for (std::size_t k = 0; k < rows; ++k) mean += first[k] / static_cast<float>(rows);
            for (std::size_t k = 0; k < rows; ++k) square += (first[k] - mean) * (first[k] - mean);
            for (std::size_t k = 0; k < rows; ++k) first[k] = (first[k] - mean) / std::sqrt(square);
        }
    }
    std::vector<float> mean() const {
        std::vector<float> sum(rows);
        for (std::size_t i = 0; i < count(); ++i)
            Blas<float>::axpy(rows, 1 / static_cast<float>(count()), values.data() + i * rows, sum.data());
        return sum;
    }
    void subtract(const std::vector<float>& mean) {
        for (std::size_t i = 0; i < count(); ++i)
            Blas<float>::axpy(rows, -1, mean.data(), values.data() + i * rows);
    }
};

Patches patchesOf(const std::vector<PointedFace>& faces, const PhotoWarper& warper) {
    Patches patches;
    for (const PointedFace& face : faces) patches.add(warper.patch(face), face);
    patches.normalise();
    return patches;
}

/// Distance of each probe to the nearest of the gallery among the pairs that are admitted.
template <class Admit>
std::vector<float> nearest(const Patches& probes, const Patches& gallery, const Admit& admit) {
    std::vector<float> products(probes.count() * gallery.count());
    Blas<float>::gemm(true, false, probes.count(), gallery.count(), probes.rows, 1, probes.values.data(),
                      gallery.values.data(), 0, products.data());
    std::vector<float> distances;
    for (std::size_t p = 0; p < probes.count(); ++p) {
        float most = -2;
        for (std::size_t g = 0; g < gallery.count(); ++g)
            if (admit(p, g)) most = std::max(most, products[g * probes.count() + p]);
        if (most > -2) distances.push_back(std::sqrt(std::max(0.0f, 2 - 2 * most)));
    }
    std::sort(distances.begin(), distances.end());
    return distances;
}

void print(const char* name, const std::vector<float>& sorted) {
    const auto at = [&](double share) {
        return sorted[static_cast<std::size_t>(share * static_cast<double>(sorted.size() - 1))];
    };
    std::cout << std::left << std::setw(44) << name << std::right << std::setw(7) << sorted.size()
              << std::fixed << std::setprecision(3);
    for (const double share : {0.0, 0.01, 0.1, 0.5, 0.9}) std::cout << std::setw(8) << at(share);
    std::cout << "\n";
}

} // namespace

void measureSynth(const std::filesystem::path& data, const std::filesystem::path& samples) {
    const std::vector<PointedFace> photos = pointedFaces(data, Labelled::Split::train, synthPhotos());
    const Synth::TextureFrame frame(meanShape(photos, synthEyeDistance));
    const PhotoWarper warper(frame);
    Patches learned = patchesOf(photos, warper);
    Patches drawn = patchesOf(pointedFaces(samples, 0, {}), warper);
    const std::vector<float> mean = learned.mean();
    for (Patches* const patches : {&learned, &drawn}) {
        patches->subtract(mean);
        patches->normalise();
    }
    std::cout
        << "distance to the nearest photo                count   least     1 %    10 %    50 %    90 %\n";
    print("portraits to photos", nearest(drawn, learned, [](std::size_t, std::size_t) { return true; }));
    print("photos to those of other people", nearest(learned, learned, [&](std::size_t p, std::size_t g) {
              // The sets show some people, and photos, in common.
              return learned.people[p] != learned.people[g] && learned.sets[p] == learned.sets[g];
          }));
    print("photos to others of the same person", nearest(learned, learned, [&](std::size_t p, std::size_t g) {
              return p != g && learned.people[p] == learned.people[g];
          }));
}

} // namespace Train
