#pragma once

#include "orbek/eyes_finder.h"
#include "orbek/image.h"
#include "orbek/score.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace Orbek::Tool {

/// What a demonstration shows: people who were enrolled, and pictures that were compared with them.
struct Demonstration {
    struct Picture {
        std::filesystem::path file;
        std::optional<Eyes::Location> eyes; ///< none if they were not found
        bool readable = false;
    };
    struct Person {
        std::string name;
        std::vector<Picture> pictures; ///< of which the record was made
        bool enrolled = false;
    };
    struct Candidate {
        std::size_t person; ///< index
        Score score;
    };
    /// A picture that no record was made of.
    struct Probe {
        std::string name; ///< of the person it shows
        Picture picture;
        std::optional<std::size_t> person; ///< index; none for a stranger
        std::optional<Score> score;        ///< with that person's record
        std::vector<Candidate> candidates; ///< the records that are most like it, the best first
    };

    std::string about; ///< what is to be known of the pictures; may be empty
    float far = 0;     ///< the false acceptance rate that is asked for
    Score threshold = 0;
    double seconds = 0; ///< that everything took
    std::vector<Person> people;
    std::vector<Probe> probes;
};

/// A page of HTML to look at, which needs nothing beside it. Reads the pictures once more.
/// @throws std::exception if one cannot be read any more
std::string demonstrationPage(const Demonstration& demonstration);

} // namespace Orbek::Tool
