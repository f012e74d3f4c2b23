#include "gallery_import.h"

#include "command.h"
#include "configuration_file.h"
#include "enrolment.h"
#include "parallel.h"
#include "record_file.h"

#include <atomic>
#include <mutex>
#include <numeric>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;
namespace fs = std::filesystem;

/// Stores entries that several threads bring: one of them writes what has come together meanwhile.
class EntryWriter {
public:
    EntryWriter(GalleryFile& gallery, GalleryFile::Present present, const FIRBuilder& builder, Output& output)
        : gallery_(gallery), present_(present), builder_(builder), output_(output) {}

    /// @param told when the entry is stored
    void add(const GalleryFile::Entry& entry, const Json& told) {
        std::unique_lock lock(mutex_);
        entries_.push_back(entry);
        results_.push_back(told);
        if (writing_) return;
        writing_ = true;
        while (!entries_.empty()) {
            const std::vector<GalleryFile::Entry> entries = std::exchange(entries_, {});
            const std::vector<Json> results = std::exchange(results_, {});
            lock.unlock();
            (void)gallery_.add(entries, present_, builder_);
            for (const Json& result : results) output_.result(result);
            lock.lock();
        }
        writing_ = false;
    }

private:
    GalleryFile& gallery_; ///< used by the thread that has set writing_
    const GalleryFile::Present present_;
    const FIRBuilder& builder_;
    Output& output_;
    std::mutex mutex_; ///< guards the rest
    bool writing_ = false;
    std::vector<GalleryFile::Entry> entries_;
    std::vector<Json> results_;
};

} // namespace

GalleryFile::Entry entryOf(const std::string& id, const FIR& record) {
    std::string bytes(record.size(), '\0');
    record.serialize(reinterpret_cast<unsigned char*>(bytes.data()));
    return {id, bytes};
}

int importFolders(const ImportOptions& options) {
    GalleryFile gallery(options.gallery);
    PictureTree tree = picturesBelow(options.folder);
    const std::size_t all = tree.folders.size();
    if (!options.replace)
        std::erase_if(tree.folders,
                      [&](const PictureTree::Folder& folder) { return gallery.has(folder.name); });
    const std::vector<PictureTree::Folder>& people = tree.folders;

    const Configuration configuration = openConfiguration(options.configuration);
    const FIRBuilder builder(configuration);
    std::vector<Enrollment::Processor> processors;
    for (unsigned int i = 0; i < options.jobs; ++i) processors.emplace_back(configuration);

    Output output(options, std::accumulate(people.begin(), people.end(), std::size_t{0},
                                           [](std::size_t sum, const auto& folder) {
                                               return sum + folder.pictures.size();
                                           }));
    for (const std::string& complaint : tree.complaints) output.complaint(complaint);
    EntryWriter writer(gallery, options.replace ? GalleryFile::Present::Replaced : GalleryFile::Present::Kept,
                       builder, output);
    std::atomic<std::size_t> enrolled = 0;
    inParallel(options.jobs, people.size(), [&](std::size_t thread, std::size_t item) {
        const auto& [id, pictures] = people[item];
        std::size_t usable = 0;
        const auto tell = [&](const Json& picture) {
            if (!picture["eyes"].is_null())
                ++usable;
            else
                output.complaint(picture["file"], "no eyes found");
        };
        std::optional<FIR> record;
        try {
            record = enrolPictures(processors[thread], pictures, output, tell);
        } catch (const std::exception& e) {
            return output.complaint(id, std::string("not enrolled, ") + e.what());
        }
        if (!record) return output.complaint(id, "not enrolled, too few usable pictures");
        writer.add(entryOf(id, *record), {{"id", id},
                                          {"pictures", pictures.size()},
                                          {"usable", usable},
                                          {"features", numberOfFeatures(*record)}});
        ++enrolled;
    });
    output.result({{"enrolled", enrolled.load()},
                   {"present", all - people.size()},
                   {"failed", people.size() - enrolled}});
    return output.complained() ? unreadable : done;
}

} // namespace Orbek::Tool
