#include "engine/postgres/lob_columns.h"

#include <algorithm>
#include <cctype>
#include <optional>

#include "engine/postgres/types.h"
#include "engine/table_list.h"
#include "oci.h"

namespace engine::postgres {
namespace {

// Where the list of columns ends.
std::optional<std::size_t> EndOfList(std::string_view sql, std::size_t& end_of_text) {
    if (QuotesOtherwise(sql)) return {};
    const PieceList pieces = Split(sql);
    std::optional<ListOfTable> read = ReadSelect(pieces);
    if (!read) read = ReadReturning(pieces);
    if (!read) return {};
    const auto end_of = [&](std::size_t piece) {
        return static_cast<std::size_t>(pieces[piece].data() - sql.data()) + pieces[piece].size();
    };
    end_of_text = end_of(pieces.back() == ";" ? pieces.size() - 2 : pieces.size() - 1);
    return end_of(read->list.last - 1);
}

std::string ItemName(std::size_t index) { return "kelp_" + std::to_string(index + 1); }

}  // namespace

bool QuotesOtherwise(std::string_view sql) {
    const bool has_escapes = sql.find("e'") != std::string_view::npos || sql.find("E'") != std::string_view::npos;
    if (has_escapes && sql.find('\\') != std::string_view::npos) return true;
    for (std::size_t at = sql.find('$'); at != std::string_view::npos; at = sql.find('$', at + 1)) {
        if (at + 1 == sql.size() || !std::isdigit(static_cast<unsigned char>(sql[at + 1]))) return true;
    }
    return false;
}

std::shared_ptr<const LobColumn> LobColumnOf(const Table& table, std::size_t number, const Column& column) {
    const TableColumn& known = table.columns[number];
    const bool is_object = known.domain == kObjectDomain;
    if (!IsLob(column) || !(table.has_rows || is_object)) return nullptr;
    const LobKind kind = column.type == SQLT_BLOB ? LobKind::bytes : LobKind::characters;
    return std::make_shared<LobColumn>(LobColumn{kind, known.name, is_object});
}

std::string BytesOf(const LobColumn& column, std::string_view value) {
    if (column.kind == LobKind::bytes) return std::string(value);
    return "pg_catalog.textsend(" + std::string(value) + ")";    // in the session's character set, which is UTF-8
}

std::string MeasureOf(const LobColumn& column, std::string_view value, bool server_has_utf8) {
    if (column.is_object) return std::string(value);
    const bool as_it_is = column.kind == LobKind::bytes || server_has_utf8;    // tells without reading it
    return "pg_catalog.octet_length(" + (as_it_is ? std::string(value) : BytesOf(column, value)) + ")";
}

std::string WithPlaces(std::string_view sql, std::size_t columns, const std::vector<LobItem>& items,
                       bool server_has_utf8) {
    std::size_t end = 0;
    const std::optional<std::size_t> list = EndOfList(sql, end);
    if (!list) return {};
    std::string names, wanted, measures;
    for (std::size_t index = 0; index < columns; ++index) {
        const std::string name = ItemName(index);
        names += name + ", ";
        if (index > 0) wanted += ", ";
        const auto item = std::find_if(items.begin(), items.end(), [&](const LobItem& lob) { return lob.index == index; });
        if (item == items.end()) {
            wanted += name;
            continue;
        }
        const std::string measure = MeasureOf(*item->column, name, server_has_utf8);
        measures += ", " + measure + "::bigint";
        if (item->column->is_object) wanted += name;
        else wanted += "case when " + measure + " <= " + std::to_string(kLongestInline) + " then " + name + " end";
    }
    std::string text = "with kelp_q(" + names + "kelp_table, kelp_place, kelp_transaction) as (";
    text.append(sql.substr(0, *list)).append(", tableoid, ctid, xmin").append(sql.substr(*list, end - *list));
    return text + "\n) select " + wanted + measures +
           ", kelp_table::bigint, kelp_place, kelp_transaction::text::bigint from kelp_q";
}

}  // namespace engine::postgres
