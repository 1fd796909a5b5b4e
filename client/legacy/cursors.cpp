// The calls on cursor areas, on the statement that the cursor owns.
#include "legacy/cursors.h"

#include <cstring>
#include <limits>
#include <string_view>
#include <utility>

#include "handles/gate.h"
#include "legacy/options.h"
#include "legacy/unfinished.h"
#include "sql/statement_text.h"
#include "statements/statement.h"
#include "values/rowid_descriptor.h"

namespace legacy {
namespace {

template <class Value>
Value Attribute(const Cursor& cursor, ub4 attribute) {
    Value value = 0;
    (void)OCIAttrGet(cursor.statement, OCI_HTYPE_STMT, &value, nullptr, attribute, cursor.error);
    return value;
}

void NoteOffset(const Cursor& cursor, Cda_Def& area) { area.peo = Attribute<ub2>(cursor, OCI_ATTR_PARSE_ERROR_OFFSET); }

// Whether the next call has to give or take a piece: then the direction is told from what is wanted.
int AskForPiece(Cursor& cursor, int result, Cursor::Waits by) {
    cursor.waits = Cursor::Waits::no;
    if (result != errors::kWantsPiece) return result;
    ub1 direction = OCI_PARAM_IN;
    (void)OCIStmtGetPieceInfo(cursor.statement, cursor.error, nullptr, nullptr, &direction, nullptr, nullptr, nullptr);
    cursor.waits = by;
    return direction == OCI_PARAM_OUT ? errors::kWantsBuffer : errors::kWantsPiece;
}

// The row that was fetched last, for oflng; null without the statement.
void ForgetRow(Cursor& cursor) {
    const CallInFlight call;
    if (auto* const statement = Live<Statement>(cursor.statement)) statement->kept_row->Forget();
}

// The result is gone, and with it an operation that waits for a piece.
void EndResult(Cursor& cursor) {
    GiveUpExecute(cursor);
    if (cursor.has_result || cursor.waits != Cursor::Waits::no) {
        const CallInFlight call;
        if (auto* const statement = Live<Statement>(cursor.statement)) {
            const SerialLock lock(*statement);
            statement->Rest();
        }
    }
    cursor.has_result = cursor.described = false;
    cursor.waits = Cursor::Waits::no;
}

// ---- Text

ub4 RunMode(const Cursor& cursor) { return cursor.login->commits ? OCI_COMMIT_ON_SUCCESS : OCI_DEFAULT; }

int ParseNow(Cursor& cursor, bool is_definition) {
    if (!is_definition) return Compile(cursor);
    const int result = RunStatement(cursor, 1, 0, RunMode(cursor));
    cursor.definition_ran = cursor.compiled = result == 0;
    return result;
}

int ParseText(Cursor& cursor, Cda_Def& area, std::string_view sql, bool deferred) {
    EndResult(cursor);
    ForgetRow(cursor);
    cursor.parsed = cursor.compiled = cursor.described = cursor.definition_ran = false;
    cursor.highest_define = 0;
    cursor.rows = cursor.rows_before = 0;
    cursor.pieces.clear();
    area.ft = 0;
    area.rpc = 0;
    area.peo = 0;
    const auto* const begin = reinterpret_cast<const OraText*>(sql.data());
    const int failed = Outcome(OCIStmtPrepare(cursor.statement, cursor.error, begin, static_cast<ub4>(sql.size()),
                                              OCI_NTV_SYNTAX, OCI_DEFAULT),
                               cursor);
    if (failed != 0) return failed;
    const sql::StatementText scanned = sql::Scan(sql);
    const bool is_definition =
        !scanned.is_block && !scanned.steps.empty() && scanned.steps[0].run == sql::Run::definition;
    area.ft = Attribute<ub2>(cursor, OCI_ATTR_SQLFNCODE);
    cursor.is_query = scanned.type == sql::StatementType::select;
    const int result = deferred ? 0 : ParseNow(cursor, is_definition);
    cursor.parsed = result == 0;
    if (result != 0) NoteOffset(cursor, area);
    return result;
}

// ---- Running

// A query opens; a column that is defined must be there.
int Opened(Cursor& cursor) {
    cursor.has_result = true;
    const int failed = CheckColumn(cursor, cursor.highest_define);
    if (failed != 0) EndResult(cursor);
    return failed;
}

// The engine's row number, of the row that a change of one touched.
void NoteRow(const Cursor& cursor, Cda_Def& area) {
    if (OCIAttrGet(cursor.statement, OCI_HTYPE_STMT, cursor.row_id, nullptr, OCI_ATTR_ROWID, cursor.error) != OCI_SUCCESS) {
        return;
    }
    const CallInFlight call;
    const auto* const row_id = Live<RowIdDescriptor>(cursor.row_id);
    if (!row_id || !row_id->value) return;
    const auto row = static_cast<std::uint64_t>(row_id->value->row);
    area.rid.rcs8 = static_cast<ub2>(row);
    area.rid.rcs7 = static_cast<ub4>(row >> 16);
    area.rid.rd.rcs5 = static_cast<ub2>(row >> 48);
}

int Run(Cursor& cursor, Cda_Def& area, ub4 iterations, ub4 first) {
    cursor.rows = cursor.rows_before = 0;
    area.rpc = 0;
    area.rid = {};
    ForgetRow(cursor);
    if (std::exchange(cursor.definition_ran, false)) return 0;
    cursor.has_result = false;
    const bool goes_on = cursor.waits == Cursor::Waits::execute;
    if (cursor.is_query) iterations = first = 0;
    int result = RunStatement(cursor, iterations, first, RunMode(cursor));
    result = AskForPiece(cursor, result, Cursor::Waits::execute);
    if (cursor.waits != Cursor::Waits::no) return result;
    if (result == 0) cursor.compiled = true;
    else if (!goes_on) NoteOffset(cursor, area);
    const bool undone = result != 0 && cursor.undoes_all;
    if (!cursor.is_query && !undone) area.rpc = Attribute<ub4>(cursor, OCI_ATTR_ROW_COUNT);
    if (result == 0 && area.rpc == 1) NoteRow(cursor, area);
    return result == 0 && cursor.is_query ? Opened(cursor) : result;
}

int FetchRows(Cursor& cursor, Cda_Def& area, sword rows) {
    area.rpc = cursor.rows;
    if (rows < 1) return errors::kNoIterations;
    if (cursor.waits == Cursor::Waits::execute) return errors::kOperationActive;
    if (!cursor.has_result) return errors::kFetchOutOfSequence;
    if (cursor.waits == Cursor::Waits::no) {
        cursor.rows_before = cursor.rows;
        ForgetRow(cursor);
    }
    int result = Outcome(OCIStmtFetch2(cursor.statement, cursor.error, static_cast<ub4>(rows), OCI_FETCH_NEXT, 0,
                                       OCI_DEFAULT),
                         cursor);
    cursor.rows = cursor.rows_before + Attribute<ub4>(cursor, OCI_ATTR_ROWS_FETCHED);
    area.rpc = cursor.rows;
    result = AskForPiece(cursor, result, Cursor::Waits::fetch);
    if (result == errors::kNoRows || result == errors::kFetchOutOfSequence) cursor.has_result = false;
    return result;
}

// Fetches into the elements and ends, whether or not there are more rows.
int FetchExactly(Cursor& cursor, Cda_Def& area, ub4 rows) {
    cursor.rows = cursor.rows_before = 0;
    if (cursor.waits == Cursor::Waits::no) {
        ForgetRow(cursor);
        if (const int failed = Compile(cursor)) {
            NoteOffset(cursor, area);
            return failed;
        }
        if (const int failed = CheckColumn(cursor, cursor.highest_define)) return failed;
    }
    int result = RunStatement(cursor, rows, 0, RunMode(cursor) | OCI_EXACT_FETCH);
    area.rpc = Attribute<ub4>(cursor, OCI_ATTR_ROWS_FETCHED);
    result = AskForPiece(cursor, result, Cursor::Waits::execute);
    if (cursor.waits != Cursor::Waits::no) return result;
    cursor.has_result = true;
    EndResult(cursor);
    return result;
}

int RunAndFetch(Cursor& cursor, Cda_Def& area, sword rows, bool cancel) {
    if (cursor.waits != Cursor::Waits::fetch) {
        if (const int failed = Run(cursor, area, 0, 0)) return failed;
    }
    const int result = FetchRows(cursor, area, rows);
    if (cancel && cursor.waits == Cursor::Waits::no) EndResult(cursor);
    return result;
}

// ---- Describing

// A column of the select list, and the first that went wrong in asking for what it is.
struct DescribedColumn {
    explicit DescribedColumn(Cursor& of) : cursor(of) {}
    ~DescribedColumn() { if (column) (void)OCIDescriptorFree(column, OCI_DTYPE_PARAM); }
    DescribedColumn(const DescribedColumn&) = delete;
    DescribedColumn& operator=(const DescribedColumn&) = delete;

    void Get(ub4 attribute, dvoid* value, ub4* length = nullptr) {
        if (failed == 0) failed = Outcome(OCIAttrGet(column, OCI_DTYPE_PARAM, value, length, attribute, cursor.error), cursor);
    }
    template <class Value, class To>
    void Put(To* place, ub4 attribute) {
        Value value = 0;
        if (place) Get(attribute, &value);
        if (place) *place = static_cast<To>(value);
    }

    Cursor& cursor;
    dvoid* column = nullptr;
    int failed = 0;
};

// The name is cut to the room announced, and not terminated.
void PutName(DescribedColumn& column, const ColumnPlaces& places) {
    OraText* name = nullptr;
    ub4 length = 0;
    if (!places.name_length) return;
    column.Get(OCI_ATTR_NAME, &name, &length);
    const sb4 room = std::max(*places.name_length, sb4{0});
    if (places.name) length = std::min(length, static_cast<ub4>(room));
    if (places.name && length > 0) std::memcpy(places.name, name, length);
    *places.name_length = static_cast<sb4>(length);
}

int DescribeColumn(Cursor& cursor, Cda_Def& area, sword position, const ColumnPlaces& places) {
    if (const int failed = Compile(cursor)) {
        NoteOffset(cursor, area);
        return failed;
    }
    if (!cursor.is_query || position < 1) return errors::kNoSuchColumn;
    if (const int failed = CheckColumn(cursor, position)) return failed;
    DescribedColumn column(cursor);
    column.failed = Outcome(OCIParamGet(cursor.statement, OCI_HTYPE_STMT, cursor.error, &column.column,
                                        static_cast<ub4>(position)), cursor);
    if (column.failed != 0) return column.failed;
    column.Put<ub2>(places.size, OCI_ATTR_DATA_SIZE);
    column.Put<ub2>(places.type, OCI_ATTR_DATA_TYPE);
    column.Put<ub4>(places.display_size, OCI_ATTR_DISP_SIZE);
    column.Put<sb2>(places.precision, OCI_ATTR_PRECISION);
    column.Put<sb1>(places.scale, OCI_ATTR_SCALE);
    column.Put<ub1>(places.null_ok, OCI_ATTR_IS_NULL);
    PutName(column, places);
    return column.failed;
}

// What a cursor waits for goes with it; the register has let it go.
void End(Cursor& cursor) {
    cursor.ended = true;
    EndResult(cursor);
}

}  // namespace

int Compile(Cursor& cursor) {
    if (cursor.has_result || (cursor.is_query ? cursor.described : cursor.compiled)) return 0;
    const int result = RunStatement(cursor, 0, 0, cursor.is_query ? OCI_DESCRIBE_ONLY : OCI_PARSE_ONLY);
    cursor.compiled = result == 0;
    cursor.described = cursor.compiled && cursor.is_query;
    return result;
}

int CheckColumn(Cursor& cursor, sword position) {
    ub4 columns = 0;
    const int failed = Outcome(OCIAttrGet(cursor.statement, OCI_HTYPE_STMT, &columns, nullptr, OCI_ATTR_PARAM_COUNT,
                                          cursor.error),
                               cursor);
    return failed == 0 && position > static_cast<sword>(columns) ? errors::kNoSuchColumn : failed;
}

sword OpenCursor(Cda_Def* area, Lda_Def* login_area) {
    const std::shared_ptr<Login> login = FindLogin(login_area);
    if (!area || FindLogin(area)) return errors::kInvalidCursor;
    if (FindCursor(area) && CloseCursor(area) == errors::kOperationActive) return errors::kOperationActive;
    std::memset(area, 0, sizeof *area);
    return SetResult(*area, Function::oopen, Guarded([&]() -> int {
        if (!login) return errors::kInvalidCursor;
        const std::lock_guard turn(login->turn);
        if (login->ended) return errors::kInvalidCursor;
        if (login->IsBusy()) return errors::kOperationActive;
        const auto cursor = std::make_shared<Cursor>(login);
        if (!cursor->Open()) return errors::kOutOfMemory;
        Enter(area, cursor);
        return 0;
    }));
}

sword CloseCursor(Cda_Def* area) {
    return OnCursor(area, Function::oclose, [area](Cursor& cursor) {
        ForgetCursor(area);
        End(cursor);
        return 0;
    });
}

void EndResults(const std::vector<std::shared_ptr<Cursor>>& cursors) {
    for (const auto& cursor : cursors) End(*cursor);
}

sword Parse(Cda_Def* area, const text* sql, sb4 length, bool deferred, ub4 language) {
    return OnCursor(area, Function::oparse, [&](Cursor& cursor) -> int {
        if (!sql) return errors::kParameterMissing;
        if (length < -1 || language > 2) return errors::kParameterOutOfRange;
        const auto* const begin = reinterpret_cast<const char*>(sql);
        const std::size_t size = length < 0 ? std::strlen(begin) : strnlen(begin, static_cast<std::size_t>(length));
        return ParseText(cursor, *area, {begin, size}, deferred);
    });
}

sword Execute(Cda_Def* area) {
    return OnRunningStatement(area, Function::oexec, [](Cursor& cursor, Cda_Def& fields) { return Run(cursor, fields, 1, 0); });
}

sword ExecuteRows(Cda_Def* area, sword iterations, sword first) {
    return OnRunningStatement(area, Function::oexec, [iterations, first](Cursor& cursor, Cda_Def& fields) -> int {
        if (!cursor.is_query && (first < 0 || iterations <= first)) {
            fields.rpc = 0;
            return errors::kNoIterations;
        }
        return Run(cursor, fields, static_cast<ub4>(iterations), static_cast<ub4>(first));
    });
}

sword ExecuteAndFetch(Cda_Def* area, ub4 rows, bool cancel, bool exact) {
    return OnRunningStatement(area, Function::oexfet, [rows, cancel, exact](Cursor& cursor, Cda_Def& fields) -> int {
        fields.rpc = 0;
        if (!cursor.is_query) return errors::kFetchOutOfSequence;
        if (rows == 0) return errors::kNoIterations;
        if (rows > static_cast<ub4>(std::numeric_limits<sword>::max())) return errors::kParameterOutOfRange;
        return exact ? FetchExactly(cursor, fields, rows) : RunAndFetch(cursor, fields, static_cast<sword>(rows), cancel);
    });
}

sword Fetch(Cda_Def* area, sword rows) {
    return OnRunningStatement(area, Function::ofetch,
                              [rows](Cursor& cursor, Cda_Def& fields) { return FetchRows(cursor, fields, rows); });
}

sword Cancel(Cda_Def* area) {
    return OnCursor(area, Function::ocan, [](Cursor& cursor) {
        EndResult(cursor);
        ForgetRow(cursor);
        return 0;
    });
}

sword Describe(Cda_Def* area, sword position, const ColumnPlaces& places) {
    return OnStatement(area, Function::odescr,
                       [&](Cursor& cursor) { return DescribeColumn(cursor, *area, position, places); });
}

}  // namespace legacy
