#pragma once

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <optional>
#include <sstream>
#include <string>

inline std::filesystem::path goldenFolder() {
    return std::filesystem::path(ORBEK_SOURCE_DIR) / "tests/golden";
}

/// Whether what is found is written down instead of compared: ORBEK_WRITE_GOLDENS=1 in the environment.
inline bool writesGoldens() {
    return std::getenv("ORBEK_WRITE_GOLDENS") != nullptr;
}

/// What the library said of its pictures when it was written down, held against what it says today. A file of
/// expected/ has a line for each fact: its name, a tab, and a number or a text.
class GoldenFacts {
public:
    explicit GoldenFacts(const std::string& name) : file_(goldenFolder() / "expected" / (name + ".tsv")) {
        std::ifstream stream(file_);
        std::string line;
        while (std::getline(stream, line))
            if (const auto tab = line.find('\t'); tab != std::string::npos)
                expected_.emplace(line.substr(0, tab), line.substr(tab + 1));
    }
    GoldenFacts(const GoldenFacts&) = delete;
    GoldenFacts& operator=(const GoldenFacts&) = delete;
    ~GoldenFacts() {
        if (writesGoldens()) {
            std::ofstream(file_) << written_.str();
            return;
        }
        for (const auto& [name, value] : expected_) ADD_FAILURE() << name << " is not told any more";
    }

    void text(const std::string& name, const std::string& value) {
        if (const auto expected = take(name, value)) {
            EXPECT_EQ(value, *expected) << name;
        }
    }
    /// @param tolerance for values up to 1, and in proportion for larger ones. Processors differ in the last
    /// bits of exponentials and of sums in a matrix product
    void number(const std::string& name, double value, double tolerance = 2e-4) {
        std::ostringstream digits;
        digits.precision(7);
        digits << value;
        if (const auto expected = take(name, digits.str())) {
            const double wanted = std::stod(*expected);
            EXPECT_NEAR(value, wanted, tolerance * std::max(1.0, std::abs(wanted))) << name;
        }
    }

private:
    /// What was written down for a name; nothing while goldens are written, or if that is missing.
    std::optional<std::string> take(const std::string& name, const std::string& value) {
        written_ << name << "\t" << value << "\n";
        if (writesGoldens()) return {};
        const auto found = expected_.extract(name);
        if (found) return found.mapped();
        ADD_FAILURE() << name << " was never written down; it is " << value;
        return {};
    }

    std::filesystem::path file_;
    std::map<std::string, std::string> expected_;
    std::ostringstream written_;
};
