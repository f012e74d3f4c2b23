#pragma once

#include <filesystem>

/// Root of the labelled photos, which lie beside the repository; empty where they are missing.
inline std::filesystem::path labelledPhotos() {
    const std::filesystem::path root = std::filesystem::path(ORBEK_SOURCE_DIR) / "../shared/data";
    return std::filesystem::exists(root) ? root : std::filesystem::path();
}
