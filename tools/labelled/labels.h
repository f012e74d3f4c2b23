#pragma once

#include "fn/geometry.h"

#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <vector>

/// Labelled images: a folder of pictures with one `labels.tsv`, tab separated with a header line.

namespace Labelled {

/// One row: a face, or an image without any.
class Row {
public:
    Row(const std::filesystem::path& image, std::map<std::string, std::string> fields)
        : image_(image), fields_(std::move(fields)) {}

    const std::filesystem::path& image() const { return image_; }
    /// The field's text, empty if it is unknown.
    std::string text(const std::string& column) const;
    std::optional<double> number(const std::string& column) const;
    /// The position in the columns <name>_x and <name>_y, image pixels.
    std::optional<FNPos> position(const std::string& name) const;
    /// What decides to which split the row belongs: the person, else the photo (whatever was cut from it) or
    /// a run of pictures that are likely to show one person.
    std::string splitKey() const;

private:
    std::filesystem::path image_;
    std::map<std::string, std::string> fields_;
};

/// @throws FNEIOError naming the file and the line
std::vector<Row> readLabels(const std::filesystem::path& tsv);

/// Which part of the data a person or photo belongs to: models learn from `train`, thresholds and mappings
/// come from `dev`, and figures from `test`.
enum class Split { train, dev, test };
Split splitOf(const std::string& key);

} // namespace Labelled
