#include "engine/sqlite/object_values.h"

#include <algorithm>

#include "engine/sqlite/connection.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/lob_columns.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

constexpr std::size_t kBlock = std::size_t{1} << 18;

// ?1: the table, ?2: its schema, ?3: the column. Words that only look like a check keep the values in memory, which is
// harmless. A column that is part of an index or refers to others must have its value when its row is written.
constexpr std::string_view kWatchers =
    "select exists(select 1 from main.sqlite_schema where type = 'trigger' and tbl_name = ?1 collate nocase"
    " union all select 1 from temp.sqlite_schema where type = 'trigger' and tbl_name = ?1 collate nocase"
    " union all select 1 from main.sqlite_schema where type = 'index' and tbl_name = ?1 collate nocase and sql like '%where%'"
    " union all select 1 from temp.sqlite_schema where type = 'index' and tbl_name = ?1 collate nocase and sql like '%where%'"
    " union all select 1 from main.sqlite_schema where type = 'table' and name = ?1 collate nocase and sql like '%check%'"
    " union all select 1 from temp.sqlite_schema where type = 'table' and name = ?1 collate nocase and sql like '%check%'"
    " union all select 1 from pragma_table_xinfo(?1, ?2) where hidden in (2, 3)"
    " union all select 1 from pragma_index_list(?1, ?2) l, pragma_index_xinfo(l.name, ?2) i"
    " where i.key and coalesce(i.name, ?3) = ?3 collate nocase"
    " union all select 1 from pragma_foreign_key_list(?1, ?2) where \"from\" = ?3 collate nocase)";

}  // namespace

std::vector<ObjectTarget> FindObjectTargets(sqlite3* database, const ValueTargets& targets, LobStore& store) {
    std::vector<ObjectTarget> found;
    for (const ValueTargets::Object& object : targets.objects) {
        TableName table = object.table;
        if (!FindNumberedTable(database, table)) continue;
        found.push_back({object.index, store.Column(table.schema, table.name, object.column, object.kind)});
    }
    return found;
}

// ---- Taking

const ObjectTarget* ObjectValues::FindTarget(std::size_t parameter, const Lob& lob) const {
    const auto of_parameter = [&](const ObjectTarget& target) { return target.parameter == parameter; };
    const auto found = std::find_if(targets_.begin(), targets_.end(), of_parameter);
    return found == targets_.end() || found->column->kind != lob.Kind() ? nullptr : &*found;
}

// Asked once a compilation: definitions make a new one.
Status ObjectValues::TableAllows(bool& allows) {
    if (!allows_) {
        const SqliteConnection::Trusted trusted(connection_);
        sqlite3_stmt* compiled = nullptr;
        int code = sqlite3_prepare_v2(connection_.Database(), kWatchers.data(), static_cast<int>(kWatchers.size()),
                                      &compiled, nullptr);
        const StatementHandle statement(compiled);
        bool watched = false;
        for (std::size_t index = 0; index < targets_.size() && code == SQLITE_OK && !watched; ++index) {
            const LobColumn& column = *targets_[index].column;
            sqlite3_bind_text(compiled, 1, column.table.c_str(), -1, SQLITE_STATIC);
            sqlite3_bind_text(compiled, 2, column.schema.c_str(), -1, SQLITE_STATIC);
            sqlite3_bind_text(compiled, 3, column.name.c_str(), -1, SQLITE_STATIC);
            if (sqlite3_step(compiled) == SQLITE_ROW) watched = sqlite3_column_int(compiled, 0) != 0;
            code = sqlite3_reset(compiled);
        }
        if (code != SQLITE_OK) return Failure(connection_.Database(), code);
        allows_ = !watched;
    }
    allows = *allows_;
    return {};
}

Status ObjectValues::Take(std::span<Datum> values) {
    waiting_.clear();
    std::vector<std::string>().swap(held_);    // of the row before
    for (std::size_t index = 0; index < values.size(); ++index) {
        if (values[index].kind != Kind::lob) continue;
        auto* const lob = static_cast<Lob*>(const_cast<void*>(values[index].data));
        std::uint64_t length = 0;
        if (Status status = Measure(*lob, length); status.Failed()) return status;
        const ObjectTarget* const target = FindTarget(index, *lob);
        bool fills = target != nullptr;
        if (Status status = fills ? TableAllows(fills) : Status(); status.Failed()) return status;
        if (fills) waiting_.push_back({target, lob, length, nullptr});
        else if (Status status = ReadWhole(index, values[index]); status.Failed()) return status;
    }
    return {};
}

std::uint64_t ObjectValues::LengthOf(const Datum& value) const {
    return std::find_if(waiting_.begin(), waiting_.end(), [&](const Waiting& object) { return object.lob == value.data; })
        ->length;
}

Status ObjectValues::Measure(Lob& lob, std::uint64_t& length) const {
    Status status = lob.Length(length);
    if (status.Failed()) return status;
    const auto most = static_cast<std::uint64_t>(sqlite3_limit(connection_.Database(), SQLITE_LIMIT_LENGTH, -1));
    return length <= most ? status : Error(errors::kLobTooLarge).From("SQLITE");
}

Status ObjectValues::ReadWhole(std::size_t index, Datum& value) {
    auto* const lob = static_cast<Lob*>(const_cast<void*>(value.data));
    std::uint64_t length = 0;
    if (Status status = Measure(*lob, length); status.Failed()) return status;
    if (held_.size() <= index) held_.resize(index + 1);
    std::string& held = held_[index];
    held.resize(static_cast<std::size_t>(length));
    std::size_t read = 0;
    if (Status status = lob->Read(0, std::as_writable_bytes(std::span(held)), read); status.Failed()) return status;
    value.kind = lob->Kind() == LobKind::characters ? Kind::text : Kind::bytes;
    value.length = static_cast<std::uint32_t>(read);
    value.data = held.data();
    return {};
}

Status ObjectValues::HoldWhole(std::span<Datum> values) {
    for (std::size_t index = 0; index < values.size(); ++index) {
        Datum& value = values[index];
        if (value.kind != Kind::lob) continue;
        for (const Waiting& object : waiting_)
            if (object.lob == value.data && object.copy) value.data = object.copy.get();
        if (Status status = ReadWhole(index, value); status.Failed()) return status;
    }
    return {};
}

// ---- Filling

Status ObjectValues::Detach() {
    for (Waiting& object : waiting_) {
        if (object.lob->IsTemporary()) continue;
        Status status = connection_.LobsOfTables().CreateTemporary(object.lob->Kind(), object.copy);
        if (status.Ok()) status = CopyBytes(*object.lob, 0, *object.copy, 0, object.length);
        if (status.Failed()) return status;
    }
    return {};
}

Status ObjectValues::Fill(std::span<const std::int64_t> rows, std::uint64_t expected) {
    refused_ = rows.size() != expected;
    for (const std::int64_t row : rows) {
        for (const Waiting& object : waiting_) {
            if (refused_) return {};
            if (Status status = FillRow(object, row); status.Failed()) return status;
        }
    }
    return {};
}

Status ObjectValues::FillRow(const Waiting& object, std::int64_t row) {
    OpenValue value;
    if (Status status = value.Open(connection_, object.target->column, row, true); status.Failed()) return status;
    Lob& lob = object.copy ? *object.copy : *object.lob;
    std::vector<std::byte> block(kBlock);
    std::size_t read = 0;
    for (std::uint64_t done = 0; done < object.length; done += read) {
        if (connection_.Stopping()) return SqliteConnection::Stopped();
        if (Status status = lob.Read(done, block, read); status.Failed()) return status;
        if (read == 0) return Error(errors::kNoLobValue).From("SQLITE");
        const int code = value.Write(done, std::span(block).first(read));
        if (code != SQLITE_OK) return connection_.Failed(code, Verb::update, true);
    }
    return {};
}

}  // namespace engine::sqlite
