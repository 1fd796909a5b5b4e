// Queries: rows in arrays, scrolled, read ahead of what another statement writes, and in pieces.
#include <cstring>
#include <vector>

#include "faults/world.h"

namespace faults {
namespace {

constexpr const char* kTwenty = "1,2,3,4,5,6,7,8,9,10,11,12,13,14,15,16,17,18,19,20,";

// A text of each length from 3 to 120, so that some rows outgrow what strings hold in themselves.
void TableOfRows(World& w) {
    w.Sql("create table t(a number, b varchar2(200))");
    w.Sql("insert into t with recursive r(n) as (select 1 union all select n + 1 from r where n < 20) "
          "select n, printf('%.*c', n * 6, 'x') from r");
    w.Sql("create table other(a number)");
    w.Sql("commit");
}

struct Rows {
    std::size_t unit = 6, room = 130;
    sb4 numbers[6] = {};
    std::vector<char> texts = std::vector<char>(6 * room);
    void Define(World& w) {
        w.Define(1, {numbers, 4, SQLT_INT});
        w.Define(2, {texts.data(), static_cast<sb4>(room), SQLT_STR});
    }
    void Show(World& w, std::size_t count) const {
        for (std::size_t row = 0; row < count; ++row)
            w.seen += std::to_string(numbers[row]) +
                      (std::strlen(&texts[row * room]) == numbers[row] * unit ? "," : " wrong,");
    }
};

ub4 RowsFetched(World& w) {
    ub4 rows = 0;
    OCIAttrGet(w.stmt, OCI_HTYPE_STMT, &rows, nullptr, OCI_ATTR_ROWS_FETCHED, w.err);
    return rows;
}

// What is left after a call that failed, undisturbed: all of it, or an error. It never ends early.
void ShowRest(World& w, Rows& rows) {
    sword code = OCI_SUCCESS;
    while (code == OCI_SUCCESS) {
        code = OCIStmtFetch2(w.stmt, w.err, 6, OCI_FETCH_NEXT, 0, OCI_DEFAULT);
        rows.Show(w, RowsFetched(w));
    }
    if (code == OCI_NO_DATA) {
        EXPECT_EQ(w.seen, kTwenty) << "the rows on both sides of the failure";
    }
}

void ShowAll(World& w, Rows& rows) {
    sword code = OCI_SUCCESS;
    Attempt([&] {
        while (code == OCI_SUCCESS) {
            code = w.Fetch(6);
            rows.Show(w, RowsFetched(w));
        }
    }, [&] { ShowRest(w, rows); });
}

SCENARIO(FetchArrays, session, TableOfRows, "1,2,3,4,5,6,7,8,9,10,11,12,13,14,15,16,17,18,19,20,18,19,20,") {
    Rows rows;
    w.Prepare("select a, b from t order by a");
    rows.Define(w);
    w.Execute(0);
    ShowAll(w, rows);
    w.Prepare("select a, b from t where a > 17 order by a");
    rows.Define(w);
    w.Execute(3, OCI_EXACT_FETCH);
    rows.Show(w, RowsFetched(w));
}

// The rows are read to the end before the other statement writes, and each takes memory of SQLite's: what fails there
// may lose the transaction, and the change must not go on outside of it. They are long: many lie on disk by then.
void FetchAhead(World& w, ub4 mode) {
    EXPECT_EQ(w.One("select count(*) from other"), "0") << "what was rolled back";
    w.Sql("insert into other values(0)");
    w.Keeps("select count(*) from other", "1");
    Rows rows{3500, 70001};
    w.Prepare("select a, printf('%.*c', a * 3500, 'x') from t");
    rows.Define(w);
    w.Execute(0, mode);
    w.Fetch(6);
    rows.Show(w, RowsFetched(w));
    Attempt([&] {
        const Instead of_query(w.stmt, w.New<OCIStmt>(OCI_HTYPE_STMT));
        w.Run("insert into other values(1)");
        w.Keeps("select count(*) from other", "2");
    }, [&] { ShowRest(w, rows); });
    ShowAll(w, rows);
}

SCENARIO(FetchAheadOfAWriter, session, TableOfRows, kTwenty) { FetchAhead(w, OCI_DEFAULT); }
SCENARIO(ScrollAheadOfAWriter, session, TableOfRows, kTwenty) { FetchAhead(w, OCI_STMT_SCROLLABLE_READONLY); }

SCENARIO(Scroll, session, TableOfRows, "1,2,;20,;12,13,14,;1,2,;5,;4,;") {
    Rows rows;
    w.Prepare("select a, b from t order by a");
    rows.Define(w);
    w.Execute(0, OCI_STMT_SCROLLABLE_READONLY);
    const struct { ub4 count; ub2 orientation; sb4 offset; } moves[] = {
        {2, OCI_FETCH_NEXT, 0}, {1, OCI_FETCH_LAST, 0}, {3, OCI_FETCH_ABSOLUTE, 12}, {2, OCI_FETCH_FIRST, 0},
        {1, OCI_FETCH_RELATIVE, 3}, {1, OCI_FETCH_PRIOR, 0}};
    for (const auto& move : moves) {
        Attempt([&] { w.Fetch(move.count, move.orientation, move.offset); }, [&] {
            if (OCIStmtFetch2(w.stmt, w.err, 1, OCI_FETCH_ABSOLUTE, 7, OCI_DEFAULT) == OCI_SUCCESS) {
                w.seen.clear();
                rows.Show(w, 1);
                EXPECT_EQ(w.seen, "7,") << "after a fetch that failed";
            }
        });
        rows.Show(w, RowsFetched(w));
        w.See("");
    }
}

// Every column is read in pieces of five bytes.
SCENARIO(PiecesOut, session, TableOfRows, "xxxxxx1;xxxxxxxxxxxx2;xxxxxxxxxxxxxxxxxx3;100;") {
    w.Prepare("select b, a from t where a < 4 order by a");
    w.Define(1, {nullptr, 1, SQLT_CHR}, OCI_DYNAMIC_FETCH);
    w.Define(2, {nullptr, 1, SQLT_CHR}, OCI_DYNAMIC_FETCH);
    w.Execute(0);
    for (int row = 1; row < 4; ++row) {
        std::string value;
        sword code = w.Fetch();
        while (code == OCI_NEED_DATA) {
            char buffer[5];
            ub4 length = sizeof buffer;
            w.Piece(buffer, length);
            code = w.Fetch();
            value.append(buffer, length);
        }
        w.See(value);
    }
    w.See(w.Fetch());
}

// One value in many forms: those of the packages, too.
SCENARIO(ManyTypes, session, TableOfRows,
         "1235;2055;155;a text that is not short at all;225;18;1000000000000000000000000000000;") {
    OCINumber number{};
    OCIDate date{};
    ub1 seven[7] = {};
    char text[60] = "";
    OCIString*& string = NewString(w);
    double real = 0;
    auto* stamp = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    auto* rowid = w.NewDescriptor<OCIRowid>(OCI_DTYPE_ROWID);
    w.Prepare("select 123.5, to_date('2024-02-29', 'YYYY-MM-DD'), to_date('2024-02-29', 'YYYY-MM-DD'), "
              "'a text that is not short at all', 2.25, systimestamp, rowid, 1e30 from t where a = 5");
    w.Define(1, {&number, sizeof number, SQLT_VNU});
    w.Define(2, {&date, sizeof date, SQLT_ODT});
    w.Define(3, {seven, sizeof seven, SQLT_DAT});
    w.Define(4, {&string, sizeof string, SQLT_VST});
    w.Define(5, {&real, sizeof real, SQLT_FLT});
    w.Define(6, {&stamp, sizeof stamp, SQLT_TIMESTAMP_TZ});
    w.Define(7, {&rowid, sizeof rowid, SQLT_RDD});
    w.Define(8, {text, sizeof text, SQLT_STR});
    w.Execute(1);
    double half = 0;
    OCINumberToReal(w.err, &number, sizeof half, &half);
    w.See(static_cast<long>(half * 10));
    w.See(date.OCIDateYYYY + date.OCIDateMM + date.OCIDateDD);
    w.See(seven[1] + seven[2] + seven[3]);
    w.See({reinterpret_cast<char*>(OCIStringPtr(w.env, string)), OCIStringSize(w.env, string)});
    w.See(static_cast<long>(real * 100));
    sb2 year = 0;
    ub1 month = 0, day = 0;
    EXPECT_EQ(OCIDateTimeGetDate(w.env, w.err, stamp, &year, &month, &day), OCI_SUCCESS);
    EXPECT_GT(year, 2000);
    ub2 length = 60;
    OraText shown[60];
    EXPECT_EQ(OCIRowidToChar(rowid, shown, &length, w.err), OCI_SUCCESS);
    w.See(length);
    w.See(text);
}

// The library's SQL functions and comparisons on values that are bound; and a sort, groups and a subquery, through which
// SQLite keeps rows of its own.
SCENARIO(FunctionsOfBinds, session, TableOfRows, "7;202401-JAN;701-JAN;50;42;39;36;33;4;") {
    char value[] = "01-JAN", text[80] = "";
    for (const char* sql : {"select a from t where to_date('03-FEB-24') > :x || '-24' and a = 7",
                            "select to_char(to_date('03-FEB-24'), 'YYYY') || :x as y from t where a = 7",
                            "select cast(a || :x as varchar2(9)) as v from t where nvl(a, 1) = 7",
                            "select distinct sum(a), substr(b, 1, 30) || mod(a, 5) from t "
                            "where a in (select a from t where a > 3 and :x is not null) "
                            "group by substr(b, 1, 30), mod(a, 5) order by 1 desc, 2"}) {
        w.Prepare(sql);
        w.Bind(1, {value, sizeof value, SQLT_STR});
        w.Define(1, {text, sizeof text, SQLT_STR});
        w.Execute(0);
        while (w.Fetch() == OCI_SUCCESS) w.See(text);
    }
}

// Texts of the application's in UTF-16 on every way.
SCENARIO(InUtf16, session, nullptr, "108;right;", OCI_UTF16) {
    const std::u16string_view sql = u"select 'a value of some length: ' || :x from dual";
    const auto bytes = [](std::u16string_view text) { return reinterpret_cast<const OraText*>(text.data()); };
    const std::u16string_view in = u"ÄÖÜ and more that is not short";
    char16_t out[80] = u"";
    ub2 length = 0;
    w.STEP(OCIStmtPrepare, w.stmt, w.err, bytes(sql), static_cast<ub4>(sql.size() * 2), OCI_NTV_SYNTAX, OCI_DEFAULT);
    OCIBind* bind = nullptr;
    w.STEP(OCIBindByName, w.stmt, &bind, w.err, bytes(u":x"), 4, const_cast<char16_t*>(in.data()),
           static_cast<sb4>(in.size() * 2), SQLT_CHR, nullptr, nullptr, nullptr, 0, nullptr, OCI_DEFAULT);
    w.Define(1, {out, sizeof out, SQLT_CHR, nullptr, &length});
    w.Execute(1);
    w.See(length);
    w.See(out[24] == u'Ä' ? "right" : "wrong");
}
}  // namespace
}  // namespace faults
