// Changes, transactions, definitions, blocks, the statement cache, and what is told of statements.
#include "faults/world.h"

namespace faults {
namespace {

void Table(World& w) {
    w.Sql("create table t(a number primary key, b varchar2(100), d date, c char(8))");
    w.Sql("create table log(a number)");
    w.Sql("create trigger written after insert on t begin insert into log values(new.a); end");
    w.Sql("create trigger gone after delete on t begin delete from log where a = old.a; end");
    w.Sql("create table many(a number, b date, c varchar2(40), d timestamp, e clob, f number)");
}

// The rows that there are, and that their triggers have written down; else -1.
constexpr const char* kCount =
    "select case when count(*) = (select count(*) from log) then count(*) else -1 end as n from t";

// A row of the same transaction that no failure may take away.
void EarlierRow(World& w) {
    w.Sql("insert into t(a, b) values(0, 'earlier')");
    w.Keeps(kCount, "1");
}

std::string Rows(World& w) {
    return w.One("select group_concat(a || coalesce(b, '-')) from (select * from t order by a)");
}

ub4 QuietAttribute(World& w, ub4 attribute) {
    ub4 value = 99;
    EXPECT_EQ(OCIAttrGet(w.stmt, OCI_HTYPE_STMT, &value, nullptr, attribute, w.err), OCI_SUCCESS);
    return value;
}

// What is executed one after the other, and what the query answers from then on, a transaction rolled back or not.
struct Change { const char *sql, *kept, *rolled_back = "0"; };
void RunAll(World& w, const char* query, std::initializer_list<Change> changes) {
    for (const Change& change : changes) {
        w.Run(change.sql);
        w.Keeps(query, change.kept, change.rolled_back);
    }
}

// An array that fails on its way keeps the rows before, and says how many they are.
sword ExecuteArray(World& w, ub4 count, ub4 mode = OCI_DEFAULT) {
    sword code = OCI_SUCCESS;
    Attempt([&] { code = w.Execute(count, mode); },
            [&] { w.Keeps(kCount, std::to_string(1 + QuietAttribute(w, OCI_ATTR_ROW_COUNT))); });
    if (code == OCI_SUCCESS) w.Keeps(kCount, std::to_string(1 + count));
    return code;
}

// Whether one of the rows of a batch failed for want of memory.
bool RowWithoutMemory(World& w, ub4 errors) {
    bool any = false;
    dvoid* other = nullptr;
    OCIHandleAlloc(w.env, &other, OCI_HTYPE_ERROR, 0, nullptr);
    for (ub4 index = 0; index < errors; ++index) {
        dvoid* row = nullptr;
        EXPECT_EQ(OCIParamGet(w.err, OCI_HTYPE_ERROR, static_cast<OCIError*>(other), &row, index), OCI_SUCCESS);
        any = any || World::Number(row, OCI_HTYPE_ERROR) == 1019;
    }
    OCIHandleFree(other, OCI_HTYPE_ERROR);
    return any;
}

struct Numbers {
    sb4 numbers[5] = {10, 20, 30, 40, 50};
    char texts[5][60] = {"aa", "a text too long for a short string", "cc", "", "ee"};
    sb2 indicators[5] = {0, 0, -1, 0, 0};
    void Bind(World& w) {
        w.Bind(1, {numbers, 4, SQLT_INT});
        w.Bind(2, {texts, 60, SQLT_STR, indicators});
    }
};

SCENARIO(ArrayOfStructures, session, Table, "earlier;a text too long for a short string;two;-;") {
    EarlierRow(w);
    w.CommitAtEnd("delete from t");
    struct Row {
        sb8 number;
        char text[40];
        sb2 indicator;
    } rows[3] = {{1, "a text too long for a short string", 0}, {2, "two", 0}, {3, "", -1}}, back[4] = {};
    w.Prepare("insert into t(a, b) values(:1, :2)");
    OCIBind* const binds[] = {w.Bind(1, {&rows[0].number, 8, SQLT_INT}),
                              w.Bind(2, {rows[0].text, 40, SQLT_STR, &rows[0].indicator})};
    for (OCIBind* bind : binds) w.STEP(OCIBindArrayOfStruct, bind, w.err, sizeof(Row), sizeof(Row), 0, 0);
    ExecuteArray(w, 3, OCI_COMMIT_ON_SUCCESS);
    w.Sql("rollback");
    w.Prepare("select a, b from t order by a");
    OCIDefine* const defines[] = {w.Define(1, {&back[0].number, 8, SQLT_INT}),
                                  w.Define(2, {back[0].text, 40, SQLT_STR, &back[0].indicator})};
    for (OCIDefine* define : defines) w.STEP(OCIDefineArrayOfStruct, define, w.err, sizeof(Row), sizeof(Row), 0, 0);
    w.Execute(4);
    for (const Row& row : back) w.See(row.indicator == -1 ? "-" : row.text);
}

// Rows 1 and 3 are refused: each gets a record of its own. So does one that finds no memory; where none is left for
// records, the call fails. Every row is accounted for.
SCENARIO(BatchErrors, session, Table, "2;1;1;1;3;0earlier,10aa,30-,50ee;") {
    EarlierRow(w);
    Numbers rows;
    rows.numbers[1] = rows.numbers[3] = 10;
    w.Prepare("insert into t(a, b) values(:1, :2)");
    rows.Bind(w);
    ExecuteArray(w, 5, OCI_BATCH_ERRORS);
    const ub4 errors = QuietAttribute(w, OCI_ATTR_NUM_DML_ERRORS), done = QuietAttribute(w, OCI_ATTR_ROW_COUNT);
    EXPECT_EQ(errors + done, 5u) << "without " << Seen().first;
    w.Keeps(kCount, std::to_string(1 + done));
    if (Seen().failed && RowWithoutMemory(w, errors)) throw Stopped();
    w.See(w.Attribute<ub4>(OCI_ATTR_NUM_DML_ERRORS));
    for (ub4 index = 0; index < 2; ++index) {
        auto* const other = w.New<OCIError>(OCI_HTYPE_ERROR);
        OCIError* const err = w.err;
        dvoid* row = nullptr;
        {
            const Instead told(w.err, other);
            w.STEP(OCIParamGet, err, OCI_HTYPE_ERROR, other, &row, index);
        }
        w.See(w.Number(row, OCI_HTYPE_ERROR));
        w.See(w.Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, row, OCI_HTYPE_ERROR));
    }
    w.See(Rows(w));
}

// Values of the packages and of descriptors, and a long one, as binds.
SCENARIO(ManyTypesIn, session, Table,
         "7 2024-02-29 01:02:03 a string of the package 2024-07-15 13:14:15 70000 2.25;") {
    EarlierRow(w);
    OCINumber number{};
    const sb4 seven = 7;
    EXPECT_EQ(OCINumberFromInt(w.err, &seven, sizeof seven, OCI_NUMBER_SIGNED, &number), OCI_SUCCESS);
    OCIDate date{2024, 2, 29, {1, 2, 3}};
    OCIString*& string = NewString(w);
    EXPECT_EQ(OCIStringAssignText(w.env, w.err, World::Text("a string of the package"), 23, &string), OCI_SUCCESS);
    auto* stamp = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP);
    EXPECT_EQ(OCIDateTimeConstruct(w.env, w.err, stamp, 2024, 7, 15, 13, 14, 15, 5, nullptr, 0), OCI_SUCCESS);
    std::string text(70000, 'x');
    double real = 2.25;
    w.Prepare("insert into many values(:1, :2, :3, :4, :5, :6)");
    w.Bind(1, {&number, sizeof number, SQLT_VNU});
    w.Bind(2, {&date, sizeof date, SQLT_ODT});
    w.Bind(3, {&string, sizeof string, SQLT_VST});
    w.Bind(4, {&stamp, sizeof stamp, SQLT_TIMESTAMP});
    w.Bind(5, {text.data(), 70000, SQLT_LNG});
    w.Bind(6, {&real, sizeof real, SQLT_FLT});
    w.Execute();
    w.See(w.One("select a || ' ' || b || ' ' || c || ' ' || d || ' ' || length(e) || ' ' || f from many"));
}

SCENARIO(Returning, session, Table,
         "naa;na text too long for a short string;;0earlier,10naa,20na text too long for a short string,30-;") {
    EarlierRow(w);
    Numbers rows;
    char texts[5][60] = {};
    sb2 indicators[5] = {};
    w.Prepare("insert into t(a, b) values(:a, 'n' || :b) returning b into :out");
    w.BindName("a", {rows.numbers, 4, SQLT_INT});
    w.BindName("b", {rows.texts, 60, SQLT_STR, rows.indicators});
    w.BindName("out", {texts, 60, SQLT_STR, indicators});
    ExecuteArray(w, 3);
    for (const auto& text : {texts[0], texts[1], texts[2]}) w.See(text);
    w.See(Rows(w));
}

// Dates, fixed texts and functions of the dialect, in values and in conditions.
SCENARIO(FunctionsAndComparisons, session, Table, "1;0earlier,1Ann01 MARCH     2024*** 1,234.50;") {
    EarlierRow(w);
    char day[] = "29-FEB-24";
    w.Prepare("insert into t(a, b, d, c) values(1, initcap('ann') || to_char(to_date('2024-03-01', 'YYYY-MM-DD'), "
              "'DD MONTH YYYY'), :1, 'ab')");
    w.Bind(1, {day, sizeof day, SQLT_STR});
    w.Execute();
    w.Keeps(kCount, "2");
    w.Run("update t set b = b || lpad(to_char(1234.5, '9,999.99'), 12, '*') where d = '29-FEB-24' and c = 'ab'");
    w.See(w.Attribute<ub4>(OCI_ATTR_ROW_COUNT));
    w.See(Rows(w));
}

// Several rows changed, and given back, by one statement; then one from another table.
SCENARIO(ChangesOfManyRows, session, Table, "2;a longer text for also earlier;0a longer text for earlier;") {
    constexpr const char* kQuery = "select count(*) || max(b) from t";
    w.Sql("insert into t(a, b) values(0, 'earlier')");
    w.Sql("insert into t(a, b) values(1, 'also earlier')");
    w.Keeps(kQuery, "2earlier", "");
    char texts[2][60] = {};
    ub4 count = 0;
    w.Prepare("begin update t set b = 'a longer text for ' || b returning b into :out; end;");
    w.BindName("out", {texts, 60, SQLT_STR}, 2, &count);
    w.Execute();
    w.Keeps(kQuery, "2a longer text for earlier", "");
    w.See(count);
    w.See(texts[1]);
    RunAll(w, kQuery, {{"insert into t(a, b) select a + 10, b from t", "4a longer text for earlier", ""},
                       {"delete from t where a > 0", "1a longer text for earlier", ""}});
    w.See(Rows(w));
}

// A definition commits what came before it, when it is done.
SCENARIO(Transactions, session, Table, "0earlier,2-;") {
    EarlierRow(w);
    w.CommitAtEnd("drop table if exists made", "delete from t");
    RunAll(w, kCount, {{"savepoint s", "1"},
                       {"insert into t(a) values(1)", "2"},
                       {"rollback to s", "1"},
                       {"commit", "1", "1"},
                       {"delete from t", "0", "1"},
                       {"rollback", "1", "1"},
                       {"insert into t(a) values(2)", "2", "1"},
                       {"create table made(n number(5,2), d date default sysdate, v varchar2(20) not null)", "2", "2"},
                       {"insert into made(n, v) values(1, 'x')", "2", "2"},
                       {"rollback", "2", "2"}});
    w.See(Rows(w));
}

SCENARIO(Block, session, Table, "6;0earlier,1-,2-,3-;") {
    EarlierRow(w);
    sb4 numbers[3] = {1, 2, 3};
    ub4 count = 3;
    sb4 total = 0;
    auto* result = w.NewDescriptor<OCIResult>(OCI_DTYPE_RSET);
    w.Prepare("begin insert into t(a) values(:1); select sum(a) into :2 from t; open :3 for select a from t; end;");
    w.Bind(1, {numbers, 4, SQLT_INT}, OCI_DEFAULT, 3, &count);
    w.Bind(2, {&total, 4, SQLT_INT});
    w.Bind(3, {&result, 8, SQLT_RSET});
    w.Execute();
    w.Keeps(kCount, "4");
    w.See(total);
    w.See(Rows(w));
}

// A cursor; and a result set, whose descriptor becomes a statement.
SCENARIO(BlockWithCursors, session, nullptr, "a value that is not short at all;77;another value that is not short;") {
    sb4 x = 77, number = 0;
    char text[40] = "";
    OCIStmt*& cursor = w.Kept<OCIStmt*>();
    dvoid*& result = w.Kept<dvoid*>();
    ub4& type = w.Kept<ub4>(OCI_DTYPE_RSET);
    w.AtEnd([&cursor] { return cursor ? OCIHandleFree(cursor, OCI_HTYPE_STMT) : OCI_SUCCESS; });
    w.STEP_TOLD(Told::environment, OCIDescriptorAlloc, w.env, &result, OCI_DTYPE_RSET, 0, nullptr);
    w.AtEnd([&] { return type == OCI_DTYPE_RSET ? OCIDescriptorFree(result, type) : OCIHandleFree(result, type); });
    w.Prepare("begin open :c for select 'a value that is not short at all', :x from dual; "
              "open :r for select 'another value that is not short' from dual; end;");
    w.BindName("c", {&cursor, 8, SQLT_CUR});
    w.BindName("x", {&x, 4, SQLT_INT});
    w.BindName("r", {&result, 8, SQLT_RSET});
    w.Execute();
    w.STEP(OCIResultSetToStmt, static_cast<OCIResult*>(result), w.err);
    type = OCI_HTYPE_STMT;
    for (OCIStmt* opened : {cursor, static_cast<OCIStmt*>(result)}) {
        const Instead of_block(w.stmt, opened);
        w.Define(1, {text, 40, SQLT_STR});
        if (opened == cursor) w.Define(2, {&number, 4, SQLT_INT});
        w.Fetch();
        w.See(text);
        if (opened == cursor) w.See(number);
    }
}

SCENARIO(IndexTables, session, Table, "5;number of the index table 5;") {
    sb4 numbers[5] = {1, 2, 3, 4, 5};
    char texts[5][40] = {};
    ub4 count = 5, texts_count = 0;
    w.Prepare("begin :2 := 'number of the index table ' || :1; end;");
    w.BindName("1", {numbers, 4, SQLT_INT}, 5, &count);
    w.BindName("2", {texts, 40, SQLT_STR}, 5, &texts_count);
    w.Execute();
    w.See(texts_count);
    w.See(texts[4]);
}

// The second statement of the block is refused: the first is undone, memory or not.
SCENARIO(BlockThatUndoesItself, session, Table, "0earlier;") {
    EarlierRow(w);
    w.Prepare("begin insert into t(a) values(1); insert into t(a) values(0); end;");
    EXPECT_THROW(w.STEP_OR(1, OCIStmtExecute, w.svc, w.stmt, w.err, 1, 0, nullptr, nullptr, OCI_DEFAULT), Stopped);
    if (w.RolledBack()) throw Stopped();
    w.See(Rows(w));
}

void TableOfIntervals(World& w) { w.Sql("create table spans(ym interval year to month, v varchar2(20))"); }

// Bound, defined, cast, as a text, and refused.
SCENARIO(IntervalValues, session, TableOfIntervals, "0;-01-02;") {
    auto* months = w.NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_YM);
    w.STEP(OCIIntervalFromText, w.env, w.err, World::Text("-1-2"), 4, months);
    w.Prepare("insert into spans values(:1, cast(:2 as interval year to month))");
    w.Bind(1, {&months, 8, SQLT_INTERVAL_YM});
    w.Bind(2, {&months, 8, SQLT_INTERVAL_YM});
    w.Execute();
    auto* back = w.NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_YM);
    char text[20] = "";
    w.Prepare("select max(ym), v from spans where ym < interval '0-1' year to month group by v");
    w.Define(1, {&back, 8, SQLT_INTERVAL_YM});
    w.Define(2, {text, sizeof text, SQLT_STR});
    w.Execute(1);
    sword order = 9;
    w.STEP(OCIIntervalCompare, w.env, w.err, months, back, &order);
    w.See(order);
    w.See(text);
}

SCENARIO(PiecesIn, session, Table, "0earlier,1first and a longer one to follow it and last,2alone;") {
    EarlierRow(w);
    sb4 numbers[2] = {1, 2};
    w.Prepare("insert into t(a, b) values(:1, :2)");
    w.Bind(1, {numbers, 4, SQLT_INT});
    w.Bind(2, {nullptr, 100, SQLT_CHR}, OCI_DATA_AT_EXEC);
    const struct { const char* data; ub1 piece; } steps[] = {
        {"first", OCI_FIRST_PIECE}, {" and a longer one to follow it", OCI_NEXT_PIECE}, {" and last", OCI_LAST_PIECE},
        {"alone", OCI_ONE_PIECE}};
    sword code = ExecuteArray(w, 2);
    for (const auto& step : steps) {
        EXPECT_EQ(code, OCI_NEED_DATA);
        ub4 length = World::Size(step.data);
        w.Piece(step.data, length, step.piece);
        Attempt([&] { code = ExecuteArray(w, 2); }, [&] {
            EXPECT_EQ(OCIStmtGetPieceInfo(w.stmt, w.err, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), OCI_ERROR)
                << "an execute that failed waits for nothing";
        });
    }
    EXPECT_EQ(code, OCI_SUCCESS);
    w.See(Rows(w));
}

// The places that callbacks give: two rows of one long value in two pieces, and what comes back behind each other.
struct DynamicPlaces {
    char value[40] = "a value that is given in two pieces";
    char taken[200] = "";
    ub4 used = 0, room = 0;

    static sb4 Give(dvoid* context, OCIBind*, ub4, ub4, dvoid** buffer, ub4* length, ub1* piece, dvoid** indicator) {
        auto& self = *static_cast<DynamicPlaces*>(context);
        const bool begins = *piece == OCI_ONE_PIECE;
        *buffer = begins ? self.value : self.value + 20;
        *length = begins ? 20 : 15;
        *piece = begins ? OCI_FIRST_PIECE : OCI_LAST_PIECE;
        *indicator = nullptr;
        return OCI_CONTINUE;
    }
    static sb4 Take(dvoid* context, OCIBind*, ub4, ub4, dvoid** buffer, ub4** length, ub1* piece, dvoid** indicator,
                    ub2** code) {
        auto& self = *static_cast<DynamicPlaces*>(context);
        self.used += self.room;
        self.room = 30;
        *buffer = self.taken + self.used, *length = &self.room;
        *indicator = nullptr, *code = nullptr;
        return *piece <= OCI_LAST_PIECE ? OCI_CONTINUE : OCI_ERROR;
    }
    static sb4 Define(dvoid* context, OCIDefine*, ub4, dvoid** buffer, ub4** length, ub1* piece, dvoid** indicator,
                      ub2** code) {
        return Take(context, nullptr, 0, 0, buffer, length, piece, indicator, code);
    }
};

SCENARIO(DynamicData, session, Table,
         "a value that is given in two piecesa value that is given in two piecesa value that is given in two pieces;") {
    EarlierRow(w);
    DynamicPlaces places;
    w.Prepare("insert into t(a, b) values((select max(a) + 1 from t), :1) returning b into :2");
    for (const ub4 position : {1, 2}) {
        OCIBind* const bind = w.Bind(position, {nullptr, 100, SQLT_CHR}, OCI_DATA_AT_EXEC);
        w.STEP(OCIBindDynamic, bind, w.err, &places, DynamicPlaces::Give, &places, DynamicPlaces::Take);
    }
    ExecuteArray(w, 2);
    w.Prepare("select b from t where a = 1");
    OCIDefine* const define = w.Define(1, {nullptr, 100, SQLT_CHR}, OCI_DYNAMIC_FETCH);
    w.STEP(OCIDefineDynamic, define, w.err, &places, DynamicPlaces::Define);
    w.Execute(1);
    w.See(places.taken);
}

SCENARIO(StatementCache, session, Table, "1;2;1;3;2;") {
    ub4 size = 2;
    w.STEP(OCIAttrSet, w.svc, OCI_HTYPE_SVCCTX, &size, 0, OCI_ATTR_STMTCACHESIZE, w.err);
    w.AtEnd([&w] {
        ub4 none = 0;
        return OCIAttrSet(w.svc, OCI_HTYPE_SVCCTX, &none, 0, OCI_ATTR_STMTCACHESIZE, w.err);
    });
    for (const char digit : {'1', '2', '1', '3', '2'}) {
        const std::string sql = std::string("select ") + digit + " from dual";
        OCIStmt* statement = nullptr;
        w.STEP(OCIStmtPrepare2, w.svc, &statement, w.err, World::Text(sql), World::Size(sql), nullptr, 0,
               OCI_NTV_SYNTAX, OCI_DEFAULT);
        sb4 value = 0;
        const Instead of_plain(w.stmt, statement);
        Attempt([&] {
            w.Define(1, {&value, 4, SQLT_INT});
            w.Execute(1);
            w.STEP(OCIStmtRelease, statement, w.err, World::Text("a key that is not short at all"), 30, OCI_DEFAULT);
        }, [&] { EXPECT_EQ(OCIStmtRelease(statement, w.err, nullptr, 0, OCI_DEFAULT), OCI_SUCCESS); });
        w.See(value);
    }
}

SCENARIO(DescribedColumns, session, Table, "A;2;a column with a long name;1;D;12;A + 1;2;2;SECOND;") {
    w.Prepare("select a, b as \"a column with a long name\", d, a + 1 from t where a = :first or a = :second");
    w.Execute(0, OCI_DESCRIBE_ONLY);
    const ub4 count = w.Attribute<ub4>(OCI_ATTR_PARAM_COUNT);
    for (ub4 position = 1; position <= count; ++position) {
        dvoid* parameter = nullptr;
        w.STEP(OCIParamGet, w.stmt, OCI_HTYPE_STMT, w.err, &parameter, position);
        w.AtEnd([parameter] { return OCIDescriptorFree(parameter, OCI_DTYPE_PARAM); });
        OraText* name = nullptr;
        ub4 length = 0;
        w.STEP(OCIAttrGet, parameter, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, w.err);
        w.See({reinterpret_cast<char*>(name), length});
        w.See(w.Attribute<ub2>(OCI_ATTR_DATA_TYPE, parameter, OCI_DTYPE_PARAM));
    }
    OraText *names[3], *indicators[3];
    ub1 lengths[3], indicator_lengths[3], repeated[3];
    OCIBind* binds[3];
    sb4 found = 0;
    w.STEP(OCIStmtGetBindInfo, w.stmt, w.err, 3, 1, &found, names, lengths, indicators, indicator_lengths, repeated,
           binds);
    w.See(found);
    w.See({reinterpret_cast<char*>(names[1]), lengths[1]});
}

// An object, its list and a member, in UTF-16; a description that fails leaves none behind, and the handle serves anew.
SCENARIO(DescribeTable, session, Table, "A;", OCI_UTF16) {
    auto* describe = w.New<OCIDescribe>(OCI_HTYPE_DESCRIBE);
    const struct { const char16_t* name; ub4 size; ub1 type; } objects[] = {
        {u"main", 8, OCI_PTYPE_SCHEMA}, {u"t", 2, OCI_PTYPE_TABLE}};
    for (const auto& object : objects) {
        w.STEP(OCIDescribeAny, w.svc, w.err, const_cast<char16_t*>(object.name), object.size, OCI_OTYPE_NAME,
               OCI_DEFAULT, object.type, describe);
    }
    auto* const root = w.Attribute<dvoid*>(OCI_ATTR_PARAM, describe, OCI_HTYPE_DESCRIBE);
    auto* const columns = w.Attribute<dvoid*>(OCI_ATTR_LIST_COLUMNS, root, OCI_DTYPE_PARAM);
    dvoid* column = nullptr;
    w.STEP(OCIParamGet, columns, OCI_DTYPE_PARAM, w.err, &column, 1);
    const auto* const name = w.Attribute<const char16_t*>(OCI_ATTR_NAME, column, OCI_DTYPE_PARAM);
    w.See(std::u16string_view(name, 1) == u"A" ? "A" : "another");
}

}  // namespace
}  // namespace faults
