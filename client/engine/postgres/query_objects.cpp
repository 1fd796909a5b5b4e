// Values for columns of large objects that the server keeps for themselves: bytes that are bound for one, and empty_blob(),
// become a new object. Which those are is asked of the server: it tells the types of placeholders in their places.
#include "engine/postgres/query_objects.h"

#include <algorithm>
#include <cstdlib>

#include "engine/pieces.h"
#include "engine/postgres/query.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr std::size_t kNotBound = static_cast<std::size_t>(-1);

// Bytes that a statement gives, and where they stand in its text.
struct Given {
    std::string_view text;
    std::size_t parameter;    // from 0; kNotBound: it is empty_blob()
};

// The kind of a placeholder's values, and its number from 0; null of what stands within quotes that are not read here.
Kind KindOf(std::string_view placeholder, const std::vector<Kind>& kinds, std::size_t& number) {
    number = std::strtoul(std::string(placeholder.substr(1)).c_str(), nullptr, 10) - 1;
    return number < kinds.size() ? kinds[number] : Kind::null;
}

// Placeholders of texts and bytes, and empty_blob().
std::vector<Given> BytesGiven(std::string_view sql, const std::vector<Kind>& kinds) {
    std::vector<Given> given;
    const PieceList pieces = Split(sql);
    for (std::size_t at = 0; at < pieces.size(); ++at) {
        const std::string_view piece = pieces[at];
        if (piece.starts_with('$')) {
            std::size_t number = 0;
            const Kind kind = KindOf(piece, kinds, number);
            if (kind == Kind::text || kind == Kind::bytes) given.push_back({piece, number});
        } else if (IsWord(piece, "empty_blob") && at + 2 < pieces.size() && pieces[at + 1] == "(" && pieces[at + 2] == ")" &&
                   pieces[at - 1] != ".") {
            const std::string_view end = pieces[at + 2];
            given.push_back({{piece.data(), static_cast<std::size_t>(end.data() + 1 - piece.data())}, kNotBound});
        }
    }
    return given;
}

// The statement with others for what it gives.
std::string WithOthers(std::string_view sql, const std::vector<Given>& given, const std::vector<std::string>& others) {
    std::string text;
    const char* from = sql.data();
    for (std::size_t index = 0; index < given.size(); ++index) {
        text.append(from, given[index].text.data()).append(others[index]);
        from = given[index].text.data() + given[index].text.size();
    }
    return text.append(from, sql.data() + sql.size());
}

// Placeholders of bytes and row ids that are, by themselves, what an insert or update stores: the numbers from 0.
std::vector<std::size_t> StoredAlone(std::string_view sql, const std::vector<Kind>& kinds) {
    std::vector<std::size_t> alone;
    std::vector<bool> open(1, true);    // at each depth: whether values stand there
    std::string_view before;
    const PieceList pieces = Split(sql);
    for (std::size_t at = 0; at < pieces.size(); before = pieces[at++]) {
        const std::string_view piece = pieces[at];
        const std::string_view next = at + 1 < pieces.size() ? pieces[at + 1] : std::string_view();
        if (piece == "(") open.push_back(IsWord(before, "values"));
        if (piece == ")" && open.size() > 1) open.pop_back();
        if (!piece.starts_with('$') || !open.back()) continue;
        const bool begins = before == "(" || before == "," || before == "=";
        const bool ends = next.empty() || next == ")" || next == "," || IsName(next);
        std::size_t number = 0;
        const Kind kind = KindOf(piece, kinds, number);
        if (begins && ends && (kind == Kind::bytes || kind == Kind::row_id)) alone.push_back(number);
    }
    return alone;
}

}  // namespace

// Bytes for a column of texts are their digits. The server would write them, and row ids, in a notation of its own.
Status PgQuery::PrepareForTexts(std::vector<Oid> types, std::uint32_t& error_offset) {
    if (effect_ != Effect::changes || (verb_ != Verb::insert && verb_ != Verb::update)) return {};
    const auto is_concerned = [](Kind kind) { return kind == Kind::bytes || kind == Kind::row_id; };
    if (std::none_of(kinds_.begin(), kinds_.end(), is_concerned)) return {};    // most statements are not read
    const std::vector<std::size_t> alone = StoredAlone(text_, kinds_);
    if (alone.empty()) return {};
    std::vector<Oid> asked = types;
    for (const std::size_t index : alone) asked[index] = 0;
    const std::string name = connection_.NewName();
    Result description;
    std::uint32_t offset = 0;
    if (Status told = SendPrepared(name, text_, asked, description, offset); !told.Ok())
        return connection_.Server().Broken() || IsPassing(told) ? told : Status();
    connection_.Forget(name);
    bool any = false;
    for (const std::size_t index : alone) {
        Oid base = PQparamtype(description.get(), static_cast<int>(index));
        if (Status status = connection_.BaseType(base); !status.Ok()) return status;
        if (!IsTextType(base)) continue;
        if (kinds_[index] == Kind::row_id) return Refused(errors::kInconsistentTypes);
        types[index] = base;
        any = true;
    }
    return any ? PrepareAs(types, error_offset) : Status();
}

// The server reads a text for such a column as the number of an object.
bool PgQuery::GivesTextsToObjects() const {
    const std::vector<Oid>& types = bound_.Types();
    for (std::size_t index = 0; index < kinds_.size(); ++index) {
        if (kinds_[index] == Kind::text && connection_.IsObjectType(types[index])) return true;
    }
    return false;
}

Status PgQuery::PrepareForObjects(Status status, std::uint32_t& error_offset) {
    const bool misfits = status.Ok() ? GivesTextsToObjects() : status.Number() == errors::kInconsistentTypes;
    if (effect_ != Effect::changes || !misfits || QuotesOtherwise(sql_)) return status;
    bool found = false;
    if (Status asked = FindObjects(found); connection_.Server().Broken() || IsPassing(asked)) return asked;
    return found ? PrepareAs(DeclaredTypes(), error_offset) : status;
}

Status PgQuery::FindObjects(bool& found) {
    std::size_t placeholders = kinds_.size();
    const std::vector<Given> given = BytesGiven(sql_, kinds_);
    if (given.empty()) return {};
    std::vector<Oid> types = DeclaredTypes();
    std::vector<std::string> others;
    std::vector<std::size_t> asked;    // the number of each's placeholder, from 0
    for (const Given& bytes : given) {
        const bool is_bound = bytes.parameter != kNotBound;
        if (is_bound) types[bytes.parameter] = 0;
        asked.push_back(is_bound ? bytes.parameter : placeholders++);
        others.push_back('$' + std::to_string(asked.back() + 1));
    }
    const std::string name = connection_.NewName();
    Result description;
    std::uint32_t offset = 0;
    Status status = SendPrepared(name, WithOthers(sql_, given, others), types, description, offset);
    if (!status.Ok()) return status;
    connection_.Forget(name);
    for (std::size_t index = 0; index < given.size(); ++index) {
        const Oid type = PQparamtype(description.get(), static_cast<int>(asked[index]));
        Oid base = type;
        if (status = connection_.BaseType(base); !status.Ok()) return status;
        const bool is_bound = given[index].parameter != kNotBound;
        others[index] = std::string(given[index].text);
        if (!connection_.IsObjectType(type)) continue;
        found = true;
        others[index] = NewObject(is_bound ? others[index] : "''::bytea");
        if (!is_bound) continue;
        makes_object_.resize(kinds_.size());
        makes_object_[given[index].parameter] = true;
    }
    text_ = WithOthers(sql_, given, others);
    return status;
}

}  // namespace engine::postgres
