#pragma once

#include "fn/deployment/app_config_db.h"
#include "fn/thread/async.h"
#include "fn/thread/mutex.h"

/// Kept in a text file, which a background thread rewrites whole after changes, in the order of the keys;
/// comments and the order of a hand-written file are lost with the first change.
///
/// The new text goes to `<file>-<process id>.tmp`, and that file then takes the configuration file's place in
/// one step;
/// `<file>.bak` holds the state before the last write. So the file is at all times either the old or the new
/// one.
///
/// Values are stored with "%" and control characters written as "%" and two hex digits, so a "%" in a
/// hand-written file introduces a code. A failed write leaves the file as it was and goes to FNDialog at
/// once; after it, every access throws the failure until the object is made anew. May be used from several
/// threads, and must not be destroyed on its own writer's thread.
class AppFileConfigDB final : public AppConfigDB {
public:
    /// @param create whether to make an empty file if there is none.
    /// @throws FNEIOError if the file cannot be read, made or parsed.
    AppFileConfigDB(const char* fileName, bool create);
    /// Waits for pending writes.
    ~AppFileConfigDB() override;

    bool exists(const std::string& key) const override;
    std::string get(const std::string& key) const override;
    void set(const std::string& key, const std::string& value) override;
    void remove(const std::string& key) override;
    /// Makes changes from outside the process visible. @throws FNEIOError
    void refresh() override;
    std::string name() const override { return fileName_; }
    void flush() override;

private:
    Pairs readFile();
    void waitForWriter() const;
    void beforeAccess(const char* what, const std::string& key) const;
    void queueWrite();
    void writeToDisk(const FNCountedPtr<char>& token);
    void writeTemporary() const;
    void moveIntoPlace() const;
    void writeFailed(const std::exception& failure);

    Pairs pairs_; // values in stored form
    FNMutex mutex_{FNMutex::recursive};
    const std::string fileName_, tmpName_, bakName_;
    FNCountedPtr<char> token_; // every pending write holds a copy
    bool writeFailed_ = false;
    std::string writeFailure_;
    bool logAccess_ = false;
    Fn::AsyncBuffer writer_{1}; // last: its thread uses the rest
};
