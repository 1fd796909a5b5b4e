// Long values of placeholders, as objects. SQLite takes a value whole, or as room for one that is filled in when the row
// stands, in blocks. The latter is done where nothing looks at the value while the row is written: the placeholder is
// all of the column's value, in a table without triggers, checks, computed columns and conditions of indexes. Any other
// value is read into memory.
#pragma once

#include <sqlite3.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "engine/datum.h"
#include "engine/sqlite/lob_store.h"
#include "engine/sqlite/value_targets.h"

namespace engine::sqlite {

struct ObjectTarget {
    std::size_t parameter;    // from 0
    std::shared_ptr<const LobColumn> column;
};

// The placeholders of a statement that may be filled in later, as far as its text tells.
std::vector<ObjectTarget> FindObjectTargets(sqlite3* database, const ValueTargets& targets, LobStore& store);

class ObjectValues {
public:
    static constexpr std::size_t kMostRows = 4096;    // that one statement is filled in of

    ObjectValues(SqliteConnection& connection, std::vector<ObjectTarget> targets)
        : connection_(connection), targets_(std::move(targets)) {}
    void Use(std::vector<ObjectTarget> targets) { targets_ = std::move(targets), allows_.reset(); }

    // Looks through the values of a row: objects that may be filled in later, if any may, stay; others are read.
    Status Take(std::span<Datum> values);
    [[nodiscard]] bool Any() const { return !waiting_.empty(); }
    [[nodiscard]] std::uint64_t LengthOf(const Datum& value) const;    // of one that stayed

    // Copies what the statement may change while it runs.
    Status Detach();
    // Fills the objects into the rows, of which there should be so many. Refused says then whether they were others.
    Status Fill(std::span<const std::int64_t> rows, std::uint64_t expected);
    [[nodiscard]] bool Refused() const { return refused_; }
    // Reads those that stayed after all.
    Status HoldWhole(std::span<Datum> values);

private:
    struct Waiting {
        const ObjectTarget* target;
        Lob* lob;
        std::uint64_t length;
        std::shared_ptr<Lob> copy;
    };
    const ObjectTarget* FindTarget(std::size_t parameter, const Lob& lob) const;
    Status TableAllows(bool& allows);
    Status Measure(Lob& lob, std::uint64_t& length) const;    // 22925 for more than a value may have
    Status ReadWhole(std::size_t index, Datum& value);
    Status FillRow(const Waiting& object, std::int64_t row);

    SqliteConnection& connection_;
    std::vector<ObjectTarget> targets_;
    std::optional<bool> allows_;          // the table
    std::vector<Waiting> waiting_;        // of the row at hand
    std::vector<std::string> held_;       // by parameter
    bool refused_ = false;
};

}  // namespace engine::sqlite
