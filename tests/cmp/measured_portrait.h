#pragma once

#include "cmp/portrait/characteristics.h"
#include "fn/serialize.h"

#include <map>

/// A portrait whose measures are told, not taken: at first those of a perfect one, 600 by 800.
struct MeasuredPortrait {
    bool isColor = true;
    unsigned int width = 600, height = 800;
    FNPos eye0{240, 340}, eye1{360, 340};
    std::array<float, 3> ethnicity{0, 0, 0};
    std::map<std::string, float> measures{{"glasses", -1},
                                          {"eye0Open", 1},
                                          {"eye1Open", 1},
                                          {"eye0GazeFrontal", 1},
                                          {"eye1GazeFrontal", 1},
                                          {"eye0Red", 0},
                                          {"eye1Red", 0},
                                          {"eye0Tinted", 0},
                                          {"eye1Tinted", 0},
                                          {"mouthClosed", 1},
                                          {"exposure", 127},
                                          {"grayScaleDensity", 200},
                                          {"naturalSkinColour", 1},
                                          {"hotSpots", 0},
                                          {"backgroundUniformity", 1},
                                          {"chin", 280},
                                          {"crown", 320},
                                          {"ear0", 160},
                                          {"ear1", 160},
                                          {"deviationFromFrontalPose", 0},
                                          {"isMale", 1},
                                          {"deviationFromUniformLighting", -1},
                                          {"sharpness", 0.5f},
                                          {"age", 30}};

    float& operator[](const std::string& measure) { return measures.at(measure); }

    operator Cmp::Portrait::Characteristics() const {
        using Point = FNPair<float, float>;
        std::list<Fn::Package> list{Fn::Package(isColor), Fn::Package(width), Fn::Package(height),
                                    Fn::serialize(Point(eye0.x, eye0.y)),
                                    Fn::serialize(Point(eye1.x, eye1.y))};
        for (const std::string measure : {"glasses",
                                          "eye0Open",
                                          "eye1Open",
                                          "eye0GazeFrontal",
                                          "eye1GazeFrontal",
                                          "eye0Red",
                                          "eye1Red",
                                          "eye0Tinted",
                                          "eye1Tinted",
                                          "mouthClosed",
                                          "exposure",
                                          "grayScaleDensity",
                                          "naturalSkinColour",
                                          "hotSpots",
                                          "backgroundUniformity",
                                          "chin",
                                          "crown",
                                          "ear0",
                                          "ear1",
                                          "deviationFromFrontalPose",
                                          "isMale",
                                          "deviationFromUniformLighting",
                                          "sharpness",
                                          "age"}) {
            const bool needsColor = measure.ends_with("Red") || measure == "naturalSkinColour";
            if (needsColor && !isColor) continue;
            const float value = measures.at(measure);
            list.push_back(measure == "grayScaleDensity"
                               ? Fn::Package(value > 0 ? static_cast<unsigned int>(value) : 0u)
                               : Fn::Package(value));
        }
        list.push_back(
            Fn::serialize(FNTriple<float, float, float>(ethnicity[0], ethnicity[1], ethnicity[2])));
        return Cmp::Portrait::Characteristics(Fn::Package(list));
    }
};
