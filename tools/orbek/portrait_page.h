#pragma once

#include "orbek/feature_test.h"
#include "portrait_checks.h"

#include <string>
#include <vector>

namespace Orbek::Tool {

/// What is found out about the portrait in a picture.
struct AssessedPortrait {
    Image image;
    Eyes::Location eyes;
    Portrait::Characteristics portrait;
    Portrait::Feature::Set features;
    ISO_19794_5::FullFrontal::Compliance compliance;
    ISO_19794_5::FullFrontal::Boundaries limits;
    std::vector<PortraitCheck> checks;
    Image token; ///< cut to a token image; null if that cannot be
};

/// One sentence: "female, white, about 31 years, no glasses".
std::string featuresText(const Portrait::Feature::Set& features);

/// A page of HTML to look at: each picture with head, eyes and allowed places drawn in, its token image, and
/// its tests with scales. The page needs nothing beside it.
class PortraitPage {
public:
    void add(const std::string& file, const AssessedPortrait& portrait);
    /// A picture that has no portrait. @param reason a sentence
    void add(const std::string& file, const std::string& reason);

    /// Writes the whole file or, if that fails, none. @throws std::runtime_error naming the file
    void write(const std::string& fileName) const;

private:
    struct Entry {
        std::string file, verdicts, body;
    };
    std::vector<Entry> entries_;
};

} // namespace Orbek::Tool
