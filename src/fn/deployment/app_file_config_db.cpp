#include "fn/deployment/app_file_config_db.h"

#include "fn/message/dialog.h"
#include "fn/text_forms.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <memory>

#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr char escape = '%';
constexpr const char* logAccessKey = "FNAppConfigLogAccess";

/// Serializes the file operations of all databases of the process.
const FNMutex& fileMutex() {
    static const auto& mutex = *new FNMutex(FNMutex::recursive);
    return mutex;
}

bool fileExists(const std::string& name) {
    struct stat status;
    return stat(name.c_str(), &status) == 0;
}

std::string systemText() {
    return std::strerror(errno);
}

} // namespace

AppFileConfigDB::AppFileConfigDB(const char* fileName, bool create)
    : fileName_(fileName), tmpName_(fileName_ + "-" + std::to_string(getpid()) + ".tmp"),
      bakName_(fileName_ + ".bak"), token_(new char(0)) {
    const FNMutexLock lock(fileMutex());
    if (create && !fileExists(fileName_) && !std::ofstream(fileName_))
        FN_THROW(FNEIOError, "Error opening config file [" + fileName_ + "] for writing");
    pairs_ = readFile();
    const auto entry = pairs_.find(logAccessKey);
    logAccess_ = entry != pairs_.end() && entry->second == "yes";
}

AppFileConfigDB::~AppFileConfigDB() {
    waitForWriter();
}

void AppFileConfigDB::waitForWriter() const {
    constexpr useconds_t pause = 10000;
    while (token_.count() > 1) usleep(pause);
}

void AppFileConfigDB::flush() {
    waitForWriter();
    const FNMutexLock lock(mutex_);
    if (writeFailed_) FN_THROW(FNEIOError, writeFailure_);
}

/// The pairs, in stored form.
AppConfigDB::Pairs AppFileConfigDB::readFile() {
    std::ifstream file(fileName_);
    if (!file) FN_THROW(FNEIOError, "Error opening config file [" + fileName_ + "] for reading");
    std::vector<Line> lines = parseLines(file);
    Pairs pairs = firstPairs(lines);
    for (Line& line : lines) line.value = Fn::UnmapCharsFromHex(line.value, escape);
    setLines(std::move(lines));
    return pairs;
}

/// What every access does first; the caller holds the mutex.
void AppFileConfigDB::beforeAccess(const char* what, const std::string& key) const {
    if (logAccess_) FNDialog::info("AppConfig: " + std::string(what) + " '" + key + "'");
    if (writeFailed_) FN_THROW(FNEIOError, writeFailure_);
    checkKey(key.c_str());
}

bool AppFileConfigDB::exists(const std::string& key) const {
    const FNMutexLock lock(mutex_);
    beforeAccess("querying", key);
    return pairs_.contains(key);
}

std::string AppFileConfigDB::get(const std::string& key) const {
    const FNMutexLock lock(mutex_);
    beforeAccess("getting ", key);
    return Fn::UnmapCharsFromHex(find(pairs_, key), escape);
}

void AppFileConfigDB::set(const std::string& key, const std::string& value) {
    {
        const FNMutexLock lock(mutex_);
        beforeAccess("changing ", key);
        pairs_[key] = Fn::MapCharsToHex(value, escape, Fn::controlChars);
    }
    queueWrite();
}

void AppFileConfigDB::remove(const std::string& key) {
    {
        const FNMutexLock lock(mutex_);
        beforeAccess("removing ", key);
        pairs_.erase(key);
    }
    queueWrite();
}

void AppFileConfigDB::refresh() {
    const FNMutexLock lock(mutex_);
    const FNMutexLock fileLock(fileMutex());
    pairs_ = readFile();
}

void AppFileConfigDB::queueWrite() {
    writer_.push_back(Fn::Functor0::callee(*this, &AppFileConfigDB::writeToDisk, token_),
                      Fn::Functor1<std::exception>::callee(*this, &AppFileConfigDB::writeFailed));
}

void AppFileConfigDB::writeFailed(const std::exception& failure) {
    {
        const FNMutexLock lock(mutex_);
        writeFailed_ = true;
        writeFailure_ = failure.what();
    }
    // Whoever made the change may never ask again.
    FNDialog::error("Changes of the configuration are not stored: " + std::string(failure.what()));
}

void AppFileConfigDB::writeToDisk(const FNCountedPtr<char>&) {
    try {
        writeTemporary();
        moveIntoPlace();
    } catch (...) {
        unlink(tmpName_.c_str());
        throw;
    }
}

/// Writes the pairs as they are now to the temporary file.
void AppFileConfigDB::writeTemporary() const {
    unlink(tmpName_.c_str());
    const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(tmpName_.c_str(), "we"),
                                                               std::fclose);
    if (!file) FN_THROW(FNEIOError, "Error opening temporary config file [" + tmpName_ + "] for writing");

    // A file that only its owner may read stays so.
    struct stat status;
    bool good =
        stat(fileName_.c_str(), &status) != 0 || fchmod(fileno(file.get()), status.st_mode & 07777) == 0;

    Pairs pairs;
    {
        const FNMutexLock lock(mutex_);
        pairs = pairs_;
    }
    for (const auto& [key, value] : pairs)
        good = std::fprintf(file.get(), "%s = %s\n", key.c_str(), value.c_str()) >= 0 && good;
    good = std::fflush(file.get()) == 0 && fsync(fileno(file.get())) == 0 && good;
    if (!good) FN_THROW(FNEIOError, "Error writing temporary config file [" + tmpName_ + "]");
}

void AppFileConfigDB::moveIntoPlace() const {
    if (fileExists(bakName_) && unlink(bakName_.c_str()) != 0)
        FN_THROW(FNEIOError, "Error removing backup config file [" + bakName_ + "]:" + systemText());

    const FNMutexLock lock(fileMutex());
    // The old file gets its second name by a link, so that its first one never leads nowhere. Not every file
    // system has links; there it is renamed, and is missing until the next step.
    const bool linked = link(fileName_.c_str(), bakName_.c_str()) == 0;
    if (!linked && rename(fileName_.c_str(), bakName_.c_str()) != 0)
        FN_THROW(FNEIOError,
                 "Error renaming file [" + fileName_ + "] to backup file [" + bakName_ + "]:" + systemText());
    if (rename(tmpName_.c_str(), fileName_.c_str()) != 0) {
        const std::string reason = systemText();
        if (!linked) (void)rename(bakName_.c_str(), fileName_.c_str());
        FN_THROW(FNEIOError, "Error moving temporary config file [" + tmpName_ + "] to config file [" +
                                 fileName_ + "]:" + reason);
    }
}
