#include "gallery_file.h"

#include "command.h"
#include "parallel.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <list>
#include <string_view>
#include <utility>

#include <sqlite3.h>

namespace Orbek::Tool {
namespace {

/// "OrbG": marks the databases that are galleries.
constexpr int applicationId = 0x4F726247;
constexpr const char* schema = "CREATE TABLE entry (id TEXT NOT NULL UNIQUE, record BLOB NOT NULL) STRICT";
/// Some ten records share a page, so that little of it is left over.
constexpr int pageSize = 32768;
/// How long to wait for other processes.
constexpr int patienceMilliseconds = 60000;
/// Portions that threads share, at most.
constexpr std::uint64_t mostPortions = 1024;

/// Others have held a lock for longer than one waits.
class InUse : public std::runtime_error {
public:
    explicit InUse(const std::string& file) : std::runtime_error(file + ": is in use by another process") {}
};

[[noreturn]] void fail(const std::string& file, sqlite3* database) {
    const std::string reason = sqlite3_errmsg(database);
    const int error = sqlite3_system_errno(database);
    switch (sqlite3_errcode(database)) {
    case SQLITE_NOTADB:
        throw UnreadableInput(file + ": is not a gallery");
    case SQLITE_CORRUPT:
        throw UnreadableInput(file + ": is damaged (" + reason + ")");
    case SQLITE_CANTOPEN:
    case SQLITE_IOERR:
        throw UnreadableInput(file + ": cannot be used (" + (error ? std::strerror(error) : reason) + ")");
    case SQLITE_BUSY:
        throw InUse(file);
    default:
        throw std::runtime_error(file + ": " + reason);
    }
}

} // namespace

class GalleryFile::Connection {
public:
    Connection(const std::string& file, int flags);
    ~Connection() { sqlite3_close(database_); }
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    const std::string& file() const { return file_; }
    void run(const std::string& sql);
    std::int64_t number(const char* sql);
    /// @throws UnreadableInput
    void demandGallery();
    void setPatience(int milliseconds) { sqlite3_busy_timeout(database_, milliseconds); }
    /// Nobody writes from now on, as long as this lives. @throws InUse
    void beginReading() {
        run("BEGIN");
        number("SELECT count(*) FROM sqlite_schema"); // takes the lock
    }

private:
    friend class Statement;
    std::string file_;
    sqlite3* database_ = nullptr;
};

/// A prepared statement. What it is given must outlive the next step.
class GalleryFile::Statement {
public:
    Statement(Connection& connection, const std::string& sql) : connection_(connection) {
        check(sqlite3_prepare_v2(connection.database_, sql.c_str(), -1, &statement_, nullptr));
    }
    ~Statement() { sqlite3_finalize(statement_); }
    Statement(const Statement&) = delete;
    Statement& operator=(const Statement&) = delete;

    Statement& text(int place, std::string_view value) {
        check(sqlite3_bind_text64(statement_, place, value.data(), value.size(), SQLITE_STATIC, SQLITE_UTF8));
        return *this;
    }
    Statement& blob(int place, std::string_view value) {
        check(sqlite3_bind_blob64(statement_, place, value.data(), value.size(), SQLITE_STATIC));
        return *this;
    }
    Statement& number(int place, std::int64_t value) {
        check(sqlite3_bind_int64(statement_, place, value));
        return *this;
    }

    /// @return whether there is a row; after the last one the statement can be run again
    bool step() {
        const int result = sqlite3_step(statement_);
        if (result == SQLITE_ROW) return true;
        if (result != SQLITE_DONE) fail(connection_.file(), connection_.database_);
        sqlite3_reset(statement_);
        return false;
    }
    /// Runs a change. @return whether there was anything to change
    bool change() {
        while (step()) {
        }
        return sqlite3_changes(connection_.database_) != 0;
    }

    /// Of the row, until the next step.
    std::string_view bytes(int column) {
        const void* const data = sqlite3_column_blob(statement_, column);
        return {static_cast<const char*>(data),
                static_cast<std::size_t>(sqlite3_column_bytes(statement_, column))};
    }
    std::int64_t number(int column) { return sqlite3_column_int64(statement_, column); }
    /// Of a row of id and record. @throws UnreadableInput
    FIR record(const FIRBuilder& builder) {
        const std::string_view record = bytes(1);
        try {
            return builder.build(reinterpret_cast<const unsigned char*>(record.data()),
                                 static_cast<unsigned int>(record.size()));
        } catch (const std::exception& e) {
            throw UnreadableInput(connection_.file() + ": the record of \"" + std::string(bytes(0)) +
                                  "\" is damaged or not one of this configuration: " + e.what());
        }
    }

private:
    void check(int result) {
        if (result != SQLITE_OK) fail(connection_.file(), connection_.database_);
    }

    Connection& connection_;
    sqlite3_stmt* statement_ = nullptr;
};

/// A change that is undone unless it is committed.
class GalleryFile::Change {
public:
    explicit Change(Connection& connection) : connection_(connection) { connection.run("BEGIN IMMEDIATE"); }
    ~Change() {
        if (committed_) return;
        try {
            connection_.run("ROLLBACK");
        } catch (const std::exception&) { // it is undone when the file is next opened
        }
    }
    Change(const Change&) = delete;
    Change& operator=(const Change&) = delete;

    void commit() {
        connection_.run("COMMIT");
        committed_ = true;
    }

private:
    Connection& connection_;
    bool committed_ = false;
};

GalleryFile::Connection::Connection(const std::string& file, int flags) : file_(file) {
    if (sqlite3_open_v2(file.c_str(), &database_, flags | SQLITE_OPEN_NOMUTEX, nullptr) != SQLITE_OK) {
        const std::unique_ptr<sqlite3, int (*)(sqlite3*)> closed(database_, sqlite3_close);
        fail(file, database_);
    }
    setPatience(patienceMilliseconds);
}

void GalleryFile::Connection::run(const std::string& sql) {
    (void)Statement(*this, sql).change();
}

std::int64_t GalleryFile::Connection::number(const char* sql) {
    Statement statement(*this, sql);
    return statement.step() ? statement.number(0) : 0;
}

void GalleryFile::Connection::demandGallery() {
    // A schema can hold programs; ours is let in and nothing else.
    Statement tables(*this, "SELECT sql FROM sqlite_schema WHERE sql IS NOT NULL");
    std::string found;
    while (tables.step()) found += tables.bytes(0);
    if (number("PRAGMA application_id") != applicationId || found != schema)
        throw UnreadableInput(file_ + ": is not a gallery");
}

void GalleryFile::create(const std::string& file) {
    const auto refuse = [&] { throw std::runtime_error(file + ": exists already"); };
    std::error_code missing;
    if (const auto size = std::filesystem::file_size(file, missing); !missing && size != 0) refuse();
    try {
        Connection connection(file, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE);
        connection.run("PRAGMA page_size = " + std::to_string(pageSize));
        Change change(connection);
        if (connection.number("SELECT count(*) FROM sqlite_schema") != 0) refuse(); // made meanwhile
        connection.run("PRAGMA application_id = " + std::to_string(applicationId));
        connection.run(schema);
        change.commit();
    } catch (const UnreadableInput& e) {
        throw std::runtime_error(e.what()); // it is no input here
    }
}

GalleryFile::GalleryFile(const std::string& file)
    : connection_(std::make_unique<Connection>(file, SQLITE_OPEN_READWRITE)) {
    connection_->demandGallery();
}

GalleryFile::~GalleryFile() = default;

std::vector<std::string> GalleryFile::ids() const {
    Statement all(*connection_, "SELECT id FROM entry ORDER BY id");
    std::vector<std::string> ids;
    while (all.step()) ids.emplace_back(all.bytes(0));
    return ids;
}

bool GalleryFile::has(const std::string& id) const {
    return Statement(*connection_, "SELECT 1 FROM entry WHERE id = ?").text(1, id).step();
}

std::vector<std::string> GalleryFile::add(const std::vector<Entry>& entries, Present present,
                                          const FIRBuilder& builder) {
    Change change(*connection_);
    {
        Statement first(*connection_, "SELECT id, record FROM entry LIMIT 1");
        if (first.step()) (void)first.record(builder); // all are of one kind
    }
    Statement insertion(*connection_,
                        std::string("INSERT INTO entry VALUES (?, ?) ON CONFLICT DO ") +
                            (present == Present::Kept ? "NOTHING" : "UPDATE SET record = excluded.record"));
    std::vector<std::string> kept;
    for (const auto& [id, record] : entries)
        if (!insertion.text(1, id).blob(2, record).change()) kept.push_back(id);
    change.commit();
    return kept;
}

std::vector<std::string> GalleryFile::remove(const std::vector<std::string>& ids) {
    Change change(*connection_);
    Statement removal(*connection_, "DELETE FROM entry WHERE id = ?");
    std::vector<std::string> missing;
    for (const std::string& id : ids)
        if (!removal.text(1, id).change()) missing.push_back(id);
    change.commit();
    return missing;
}

void GalleryFile::read(const Configuration& configuration, std::uint64_t partSize, unsigned int jobs,
                       const std::function<void(const Population& part)>& take) const {
    const FIRBuilder builder(configuration);
    // Those that read at the same time see the same state: as many as get in beside the first one.
    std::list<Connection> readers;
    while (readers.size() < std::max(jobs, 1u)) {
        Connection& reader = readers.emplace_back(connection_->file(), SQLITE_OPEN_READWRITE);
        const bool first = readers.size() == 1;
        if (!first) reader.setPatience(0);
        try {
            reader.beginReading();
        } catch (const InUse&) {
            if (first) throw;
            readers.pop_back();
            break;
        }
    }
    std::list<Statement> selections;
    std::vector<Statement*> selectionOf;
    for (Connection& reader : readers) {
        constexpr const char* sql = "SELECT id, record FROM entry WHERE rowid BETWEEN ? AND ? ORDER BY rowid";
        selectionOf.push_back(&selections.emplace_back(reader, sql));
    }

    const auto first = static_cast<std::uint64_t>(readers.front().number("SELECT min(rowid) FROM entry"));
    const auto last = static_cast<std::uint64_t>(readers.front().number("SELECT max(rowid) FROM entry"));
    // Ids of rows need not be dense, and may lie anywhere: threads take ranges of them, not too many.
    const std::uint64_t portion = std::max((last - first) / mostPortions + 1, partSize);
    inParallel(readers.size(), (last - first) / portion + 1, [&](std::size_t thread, std::size_t item) {
        const std::uint64_t begin = first + item * portion, end = begin + std::min(portion - 1, last - begin);
        Statement& selection = selectionOf[thread]
                                   ->number(1, static_cast<std::int64_t>(begin))
                                   .number(2, static_cast<std::int64_t>(end));
        for (bool more = selection.step(); more;) {
            Population part(configuration);
            for (std::uint64_t size = 0; more && size < partSize; ++size, more = selection.step())
                part.append(selection.record(builder), std::string(selection.bytes(0)));
            take(part);
        }
    });
}

} // namespace Orbek::Tool
