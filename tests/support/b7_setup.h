#pragma once

#include "cmp/b7/cmp_algorithm.h"
#include "cmp/b7/core.h"
#include "cmp/mapping_files.h"
#include "fn/deployment/app_config_db.h"
#include "support/scratch_folder.h"

#include <gtest/gtest.h>

#include <random>
#include <sstream>

/// B7 with a transformation of a few weights, and finders that find what a test tells them to.
class B7Setup : public testing::Test {
public:
    /// What the finders answer; nothing where the confidence is 0.
    struct Found {
        FacialFeatureLocation left{{0, 0}, 0, 0}, right{{0, 0}, 0, 0};
        FacialFeatureLocation mouth{{0, 0}, 0, 0}, bridge{{0, 0}, 0, 0};
        Cmp::B7::PortraitMeasures portrait;
        FNPos speed{0, 0}; ///< of the eyes, pixels in a second of capture time
    };

protected:
    using Algorithm = FNCountedPtr<Cmp::B7::CmpAlgorithm>;

    static void SetUpTestSuite() {
        folder_ = new ScratchFolder;
        constexpr std::size_t raw = 20604, components = 5912;
        std::mt19937 random(3);
        Cmp::B7::Transformation t{0.01f, Fn::Matrix<signed char>(raw, components), FNVector<float>(raw, 0.3f),
                                  FNVector<float>(components, 0.0f), FNVector<float>(components, 0.0f)};
        t.matrix.fill(0);
        signed char* const weights = t.matrix.getExclusive();
        for (std::size_t c = 0; c < components; ++c)
            for (int i = 0; i < 8; ++i)
                weights[c * raw + random() % raw] = static_cast<signed char>(random() % 255 - 127);
        t.write(folder_->file("trans-b7.dat"));
    }
    /// Mappings from raw scores up to 4000, normalized ones up to 10, to scores, and to rates: of false
    /// acceptance down from 1, of false rejection up to 0.5.
    static void writeMappings() {
        const auto write = [](const std::string& name, float first, float last, float xMax) {
            const Fn::InvertibleFunction<float, float> mapping(FNVector<float>(std::vector{first, last}), 0,
                                                               xMax);
            Cmp::Implementation::writeMappingFile(mapping, folder_->file(name));
        };
        write("smap-b7.dat", 0, 1, 4000);
        write("smap-b7-sn.dat", 0, 1, 10);
        for (const std::string names : {"b7.dat", "b7-sn.dat"}) {
            write("farmap-" + names, 1, 0, 1);
            write("frrmap-" + names, 0, 0.5f, 1);
        }
    }
    static void TearDownTestSuite() {
        delete folder_;
        folder_ = nullptr;
    }

    /// @param text lines of a configuration that has the settings below "X"
    Algorithm algorithm(const std::string& text = {}) const { return algorithm(text, Found()); }
    Algorithm algorithm(const std::string& text, const Found& found) const {
        std::istringstream stream("X.DataDir = " + folder_->path().string() + "\n" + text);
        using Cmp::B7::CmpAlgorithm;
        const Fn::Deployment::Type& type = Fn::Deployment::type<CmpAlgorithm>();
        const Fn::Deployment::Component component(
            FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(stream)),
            Fn::Deployment::Property(type, "X", type.defaultValue(), "", false));
        const Cmp::B7::Finders finders{
            EyesFinder(FNCountedPtr<EyesFinder::Body>(new Eyes(found))),
            MouthFinder(FNCountedPtr<MouthFinder::Body>(new Feature<MouthFinder>(found.mouth))),
            BridgeFinder(FNCountedPtr<BridgeFinder::Body>(new Feature<BridgeFinder>(found.bridge))),
            [measures = found.portrait](const Cmp::Face&, const auto&) { return measures; }};
        return Algorithm(new CmpAlgorithm(component, finders));
    }

    static const ScratchFolder& folder() { return *folder_; }

private:
    static bool give(const FacialFeatureLocation& answer, FacialFeatureLocation& result) {
        if (answer.confidence == 0) return false;
        result = answer;
        return true;
    }

    struct Eyes final : EyesFinder::Body {
        explicit Eyes(const Found& found) : found_(found) {}
        void find(const FaceFinder::Location&, const FNImageReference& image, bool& foundFirst,
                  FacialFeatureLocation& first, bool& foundSecond,
                  FacialFeatureLocation& second) const override {
            foundFirst = give(found_.left, first);
            foundSecond = give(found_.right, second);
            const auto time = Fn::getImageCaptureTime(image.attributes());
            if (!time.isSet()) return;
            const FNPos moved = found_.speed * std::chrono::duration<float>(time->sinceEpoch()).count();
            first.pos += moved;
            second.pos += moved;
        }
        void find(const FacialFeatureLocation&, const FacialFeatureLocation&, const FNImageReference&, bool&,
                  FacialFeatureLocation&, bool&, FacialFeatureLocation&) const override {}
        std::string processingId() const override { return {}; }
        Found found_;
    };
    template <class Finder> struct Feature final : Finder::Body {
        explicit Feature(const FacialFeatureLocation& answer) : answer_(answer) {}
        bool find(const FacialFeatureLocation&, const FacialFeatureLocation&, const FNImageReference&,
                  FacialFeatureLocation& result) const override {
            return give(answer_, result);
        }
        std::string processingId() const override { return {}; }
        FacialFeatureLocation answer_;
    };

    static inline ScratchFolder* folder_ = nullptr;
};
