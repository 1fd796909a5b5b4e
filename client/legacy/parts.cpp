// Parts of the row that was fetched last.
#include <algorithm>
#include <cstring>

#include "handles/gate.h"
#include "legacy/cursors.h"
#include "statements/statement.h"

namespace legacy {
namespace {

bool IsOneOf(sword type, std::initializer_list<sword> types) {
    return std::find(types.begin(), types.end(), type) != types.end();
}

int CheckPart(const Part& part) {
    if (!IsOneOf(part.type, {SQLT_CHR, SQLT_LNG, SQLT_BIN, SQLT_LBI})) return errors::kIllegalType;
    if (part.room < 0 || part.offset < 0) return errors::kParameterOutOfRange;
    return !part.buffer && part.room > 0 ? errors::kParameterMissing : 0;
}

int Read(const KeptRow& row, sword position, const Part& part) {
    if (!row.HasRow()) return errors::kFetchOutOfSequence;
    if (position < 1 || static_cast<std::size_t>(position) > row.Columns()) return errors::kNoSuchColumn;
    const auto column = static_cast<std::size_t>(position) - 1;
    const bool has_parts = IsOneOf(row.Type(column), {SQLT_CHR, SQLT_AFC, SQLT_LNG, SQLT_BIN, SQLT_LBI});
    if (!has_parts) return errors::kInconsistentTypes;
    if (row.KindOf(column) == engine::Kind::null) return errors::kNullFetched;
    const std::string_view bytes = row.Bytes(column);
    const std::size_t begin = std::min(bytes.size(), static_cast<std::size_t>(part.offset));
    const std::size_t length = std::min(bytes.size() - begin, static_cast<std::size_t>(part.room));
    if (length > 0) std::memcpy(part.buffer, bytes.data() + begin, length);
    if (part.length) *part.length = static_cast<ub4>(length);
    return 0;
}

}  // namespace

sword ReadPart(Cda_Def* area, sword position, const Part& part) {
    return OnStatement(area, Function::oflng, [&](Cursor& cursor) -> int {
        if (const int failed = CheckPart(part)) return failed;
        if (cursor.waits != Cursor::Waits::no) return errors::kOperationActive;
        const CallInFlight call;
        const auto* const statement = Live<Statement>(cursor.statement);
        return statement ? Read(*statement->kept_row, position, part) : errors::kNotLoggedOn;
    });
}

}  // namespace legacy
