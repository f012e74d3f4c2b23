#pragma once

#include "fn/imagefile/byte_stream.h"
#include "fn/message/dialog.h"
#include "shapeimg/scanfile/scan_file.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>

/// Feeds `data` to a reader of scans with a picture of 8 by 8 pixels beside them: it gives a scan whose
/// pixels lead to points of it, or throws one of our exceptions.
template <class Read> int fuzzScanReader(const unsigned char* data, std::size_t size, Read read) {
    struct Folder {
        Folder() {
            std::string name = (std::filesystem::temp_directory_path() / "orbek-fuzz-XXXXXX").string();
            if (!mkdtemp(name.data())) std::abort();
            path = name;
            std::ofstream(path / "scan.bmp", std::ios::binary) << "P5 8 8 255\n" << std::string(64, 'x');
        }
        ~Folder() {
            std::error_code ignored;
            std::filesystem::remove_all(path, ignored);
        }
        std::filesystem::path path;
    };
    static const Folder folder;
    Fn::ImageLimits limits;
    limits.maxPixels = 1u << 18;
    limits.maxBytes = 1u << 24;
    Fn::MemoryStream stream(reinterpret_cast<const char*>(data), size);
    try {
        const ShapeImage::TexturedPointSet scan =
            read(static_cast<std::istream&>(stream), (folder.path / "scan").string(), limits);
        for (int i = -1; i <= 8; ++i) scan.mapTexture2Vertex({i, i});
        if (!scan.points().empty() && scan.points().findClosest(scan.points().center(), 1e200, 1).empty())
            std::abort();
    } catch (const FNException&) {
    }
    return 0;
}
