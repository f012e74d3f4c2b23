#pragma once

#include "orbek/fir_builder.h"
#include "orbek/population.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace Orbek::Tool {

/// A population on disk: records in their package form, each under an id of its own. It is a database of
/// SQLite with one table, and remembers nothing else.
///
/// Each change is whole or not there, also if the process is killed, and on the disk when its function
/// returns. Several processes may use a gallery at the same time; one that writes waits until the others have
/// read. An object is for one thread at a time.
class GalleryFile {
public:
    /// A record under its id.
    struct Entry {
        std::string id;
        std::string record; ///< as FIR::serialize() writes it
    };
    /// What becomes of an entry that is there when another comes under its id.
    enum class Present { Kept, Replaced };

    /// Makes an empty gallery. @throws std::runtime_error naming the file if it has content, or cannot be
    /// written
    static void create(const std::string& file);

    /// Opens a gallery.
    /// @throws UnreadableInput naming the file and the reason; so do all functions, and std::runtime_error
    /// naming the file if it cannot be written or others do not let go of it
    explicit GalleryFile(const std::string& file);
    ~GalleryFile();
    GalleryFile(const GalleryFile&) = delete;
    GalleryFile& operator=(const GalleryFile&) = delete;

    /// In the order of their bytes.
    std::vector<std::string> ids() const;
    bool has(const std::string& id) const;

    /// Adds all or, if that fails, none.
    /// @param builder of the configuration that the records come from; UnreadableInput if it cannot use those
    /// that are there
    /// @return the ids that were kept as they were, in the given order
    std::vector<std::string> add(const std::vector<Entry>& entries, Present present,
                                 const FIRBuilder& builder);
    /// Removes those that are there. @return the ids that are not, in the given order
    std::vector<std::string> remove(const std::vector<std::string>& ids);

    /// Gives all records to `take`, part by part, so that a gallery may be larger than memory. All parts show
    /// the same state.
    /// @param partSize records of a part, at most
    /// @param jobs threads that share the work; `take` is called on them, at the same time
    void read(const Configuration& configuration, std::uint64_t partSize, unsigned int jobs,
              const std::function<void(const Population& part)>& take) const;

private:
    class Connection;
    class Statement;
    class Change;
    std::unique_ptr<Connection> connection_;
};

} // namespace Orbek::Tool
