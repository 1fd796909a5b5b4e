// Where a SQLite database is at home: its file, and a handle on it that no session uses just now. The attached database
// and its connections share it, and it lasts as long as one of them. From any thread.
//
// The tables of a database in memory live in its handle, so that a session which ends gives it back for the next one,
// without what was that session's alone: its transaction, its temporary objects, its settings. A handle on a file is
// used by one session and closed.
#pragma once

#include <sqlite3.h>
#include <sys/stat.h>

#include <memory>
#include <mutex>
#include <string>

#include "handles/status.h"

namespace engine::sqlite {

struct DatabaseCloser {
    void operator()(sqlite3* database) const { sqlite3_close_v2(database); }
};
struct StatementCloser {
    void operator()(sqlite3_stmt* statement) const { sqlite3_finalize(statement); }
};
using DatabaseHandle = std::unique_ptr<sqlite3, DatabaseCloser>;
using StatementHandle = std::unique_ptr<sqlite3_stmt, StatementCloser>;

// An open handle. A file that can neither be written nor have a log beside it is opened as one that nobody changes.
struct OpenHandle {
    DatabaseHandle database;
    bool immutable = false;
    struct stat seen{};    // the immutable file when it was opened
};

class Home {
public:
    explicit Home(std::string file) : file_(std::move(file)), private_(file_ == ":memory:") {}

    Status Open();     // for the first time; the handle is kept for the first Take
    void Close() noexcept;    // the database is detached: what comes back is closed

    Status Take(OpenHandle& handle);
    void GiveBack(OpenHandle handle) noexcept;

    [[nodiscard]] const std::string& File() const { return file_; }
    [[nodiscard]] bool Private() const { return private_; }    // nobody else can open the database
    // Whether an immutable file is what it was; else pages that the handle knows may be of another time.
    [[nodiscard]] bool Unchanged(const OpenHandle& handle) const;
    // To be held while a session begins: the tables of a database in memory are with one that may be refused.
    [[nodiscard]] std::unique_lock<std::mutex> Door() {
        return private_ ? std::unique_lock(door_) : std::unique_lock<std::mutex>();
    }

private:
    [[nodiscard]] Status OpenNew(OpenHandle& handle) const;
    [[nodiscard]] bool HasLog() const;

    std::string file_;    // set before anybody shares it; absolute once it was opened
    const bool private_;
    std::mutex door_;
    std::mutex mutex_;    // of what follows
    bool open_ = false;
    OpenHandle spare_;
};

}  // namespace engine::sqlite
