#pragma once

#include "gallery_file.h"
#include "options.h"

namespace Orbek::Tool {

struct ImportOptions : CommonOptions {
    std::string gallery;
    std::string folder;
    bool replace = false;
    unsigned int jobs = 0;
};

/// An entry with a record that is there.
GalleryFile::Entry entryOf(const std::string& id, const FIR& record);

/// Enrols the people of a folder tree. Tells of each when the gallery has the record for good, complains of
/// pictures and people that cannot be used, and at last tells how many there were.
/// @return the exit status
int importFolders(const ImportOptions& options);

} // namespace Orbek::Tool
