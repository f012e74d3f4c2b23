#include "gallery_import.h"

#include "command.h"
#include "configuration_file.h"
#include "enrolment.h"
#include "parallel.h"
#include "record_file.h"

#include <algorithm>
#include <atomic>
#include <condition_variable>
#include <mutex>
#include <numeric>
#include <thread>
#include <utility>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;
namespace fs = std::filesystem;

/// Stores entries that several threads bring, on a thread of its own: what has come together is one change of
/// the gallery, and those who enrol do not wait for the disk.
class EntryWriter {
public:
    EntryWriter(GalleryFile& gallery, GalleryFile::Present present, const FIRBuilder& builder, Output& output)
        : gallery_(gallery), present_(present), builder_(builder), output_(output),
          thread_([this] { run(); }) {}
    ~EntryWriter() { close(); }
    EntryWriter(const EntryWriter&) = delete;
    EntryWriter& operator=(const EntryWriter&) = delete;

    /// @param told when the entry is stored. @throws what has stopped the writing
    void add(const GalleryFile::Entry& entry, const Json& told) {
        const std::lock_guard lock(mutex_);
        if (failure_) std::rethrow_exception(failure_);
        entries_.push_back(entry);
        results_.push_back(told);
        changed_.notify_one();
    }
    /// Waits until all is stored.
    /// @return how many were not, since other processes had been faster. @throws what has stopped the writing
    std::size_t finish() {
        close();
        if (failure_) std::rethrow_exception(failure_);
        return kept_;
    }

private:
    void run() {
        try {
            std::unique_lock lock(mutex_);
            while (changed_.wait(lock, [this] { return closed_ || !entries_.empty(); }), !entries_.empty()) {
                const std::vector<GalleryFile::Entry> entries = std::exchange(entries_, {});
                const std::vector<Json> results = std::exchange(results_, {});
                lock.unlock();
                const std::vector<std::string> kept = gallery_.add(entries, present_, builder_);
                for (const Json& result : results)
                    if (std::ranges::find(kept, result["id"].get<std::string>()) == kept.end())
                        output_.result(result);
                lock.lock();
                kept_ += kept.size();
            }
        } catch (...) {
            const std::lock_guard lock(mutex_);
            failure_ = std::current_exception();
        }
    }
    void close() {
        {
            const std::lock_guard lock(mutex_);
            closed_ = true;
            changed_.notify_one();
        }
        if (thread_.joinable()) thread_.join();
    }

    GalleryFile& gallery_; ///< used by the thread alone
    const GalleryFile::Present present_;
    const FIRBuilder& builder_;
    Output& output_;
    std::mutex mutex_; ///< guards what the threads share
    std::condition_variable changed_;
    std::vector<GalleryFile::Entry> entries_;
    std::vector<Json> results_;
    std::size_t kept_ = 0;
    bool closed_ = false;
    std::exception_ptr failure_;
    std::thread thread_; // last: it uses the rest
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
    for (std::size_t i = 0; i < std::min<std::size_t>(options.jobs, people.size()); ++i)
        processors.emplace_back(configuration);

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
    const std::size_t kept = writer.finish();
    output.result({{"enrolled", enrolled - kept},
                   {"present", all - people.size() + kept},
                   {"failed", people.size() - enrolled}});
    return output.complained() ? unreadable : done;
}

} // namespace Orbek::Tool
