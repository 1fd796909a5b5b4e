// What SQL text means on the embedded engine, as an application sees it: values compared and stored where SQLite alone
// would take texts as they stand, what expressions are described as, what definitions say, what is refused.
#include <ostream>
#include <tuple>

#include "support/statement_fixture.h"

namespace {

class SqliteMeaning : public StatementTest {
protected:
    // All rows of a query: columns with ',', nulls as '-', rows with ';' behind them; "!" and a number for an error.
    // `bound` is the value of every placeholder.
    std::string Rows(std::string_view sql, const char* bound = nullptr) {
        if (const sb4 error = PrepareBound(sql, bound); error != 0) return "!" + std::to_string(error);
        if (const sb4 error = Execute(0); error != 0) return "!" + std::to_string(error);
        char text[4][200];
        sb2 indicators[4] = {};
        const ub4 columns = Attribute<ub4>(OCI_ATTR_PARAM_COUNT);
        for (ub4 column = 0; column < columns; ++column)
            EXPECT_EQ(Define(column + 1, {text[column], sizeof text[column], SQLT_STR, &indicators[column]}), 0);
        std::string rows;
        for (;;) {
            const sb4 error = Fetch();
            if (error == 1403) return rows;
            if (error != 0) return rows + "!" + std::to_string(error);
            for (ub4 column = 0; column < columns; ++column)
                rows.append(column ? "," : "").append(indicators[column] == -1 ? "-" : text[column]);
            rows += ';';
        }
    }
    // The number of the error, 0 for none.
    sb4 RunBound(std::string_view sql, const char* bound = nullptr) {
        const sb4 error = PrepareBound(sql, bound);
        return error != 0 ? error : Execute();
    }
    sb4 PrepareBound(std::string_view sql, const char* bound) {
        sb4 error = Prepare(sql);
        for (ub4 position = 1; bound && error == 0 && position <= Attribute<ub4>(OCI_ATTR_BIND_COUNT); ++position)
            error = Bind(position, {const_cast<char*>(bound), static_cast<sb4>(std::strlen(bound)), SQLT_CHR});
        return error;
    }
    static std::string With(std::string_view sql, const std::string& value) {
        std::string text(sql);
        for (std::size_t at; (at = text.find('%')) != std::string::npos;) text.replace(at, 1, value);
        return text;
    }
    void MakeTables() {
        MustRun("create table t(id integer, d date, c char(5), n number, r raw(2), v varchar2(9))");
        MustRun("create table u(id integer, e timestamp, d varchar2(20), c varchar2(9), n number, f decfloat(16), g decfloat(34))");
        MustRun("insert into t values(1, '03-FEB-24', 'ab', 5, '0A', 'x ')");
        MustRun("insert into t values(2, '01-DEC-99', 'abc', 10, '0B', 'x')");
        MustRun("insert into u values(1, '03-FEB-24 10.00.00 AM', '03-FEB-24', 'ab   ', 1, '1.500000000000000001', 1.5)",
                "create table few(id integer, n number)", "insert into few values(1, 5)",
                "create view part as select id, n, d from t");
    }
};

// The same condition with its text as a literal and through a placeholder; rows are ids of t.
TEST_F(SqliteMeaning, TextsAreComparedAsTheColumnsValues) {
    MakeTables();
    const struct { const char* sql; const char* text; const char* rows; } cases[] = {
        {"select id from t where d <= %", "01-JAN-20", "2;"}, {"select id from t where % < t.d", "01-JAN-20", "1;"},
        {"select id from t where d not between '01-JAN-00' and %", "31-DEC-20", "1;2;"},
        {"select id from t where c not in (%)", "ab ", "2;"}, {"select id from t where c <> %", "abc     ", "1;"},
        {"select id from t where c < %", "abcdefgh", "1;2;"}, {"select id from u where f = %", "1.5", "1;"},
        {"select id from u where g = %", "1.5", "1;"},
        {"select id from u where f < %", "1.500000000000000001", "1;"},
        {"select case d when % then 1 end as a, case v when 'x' then 2 end as b from t", "03-FEB-24", "1,-;-,2;"},
        {"select id from t where % = trunc(d) and (id = 1)", "03-FEB-24", "1;"},
        {"select id from (select id, d 'day' from t) x where day > %", "01-JAN-24", "1;"},
        {"select id from (select id, d as 'it''s' from t) x where \"it's\" > %", "01-JAN-24", "1;"},
        {"select id from t where n > %", "7", "2;"}, {"select id from t where n = %", "x", "!1722"},
        {"select id from t where (d = % or 1 = 0)", "03-FEB-24", "1;"},
        {"select id from t where substr(c, 1, 2) = %", "ab", "1;2;"},
        {"select id from t where exists(select 1 from u where u.e > % and u.id = t.id)", "02-FEB-24 09.00.00 AM", "1;"},
        {"select x.id from u as y, t as x where x.d = %", "03-FEB-24", "1;"},
        {"select t.id from t, u x where t.id = x.id and e > %", "03-FEB-24 09.59.00 AM", "1;"},
        {"select id from t where (d) = %", "03-FEB-24", "1;"},
        {"select id from t where ((t.d)) = (%)", "03-FEB-24", "1;"},
        {"select id from t where d = ( ( % ) ) or (1 = 0)", "03-FEB-24", "1;"},
        {"select id from t where not (d) = %", "03-FEB-24", "2;"},
        {"select id from t where % between d and d", "03-FEB-24", "1;"},
        {"select id from t where d between '01-JAN-24' and %", "31-DEC-24", "1;"},
        {"select id from t where % in (d, d)", "03-FEB-24", "1;"},
        {"select id from t where (id, d) = (1, %)", "03-FEB-24", "1;"},
        {"select id from t where trunc(d) = %", "03-FEB-24", "1;"},
        {"select id from t where last_day(d) > %", "28-FEB-24", "1;"},
        {"select id from t where % < add_months(d, 1)", "01-MAR-24", "1;"},
        {"select id from t where nvl(t.d, sysdate) = %", "03-FEB-24", "1;"},
        {"select id from t group by id having max(d) > %", "01-JAN-24", "1;"},
        {"select id from t group by id having % between max(d) filter (where 1 = 1) and max(d)", "03-FEB-24", "1;"},
        {"select id from t where sysdate > % and id = 1", "31-JAN-24", "1;"},
        {"select id from t where /**/ d /* it's ( */ = -- it's (\n %", "03-FEB-24", "1;"},
        {"select id from (select t.* from t, u) x where d > %", "31-JAN-24", "1;"},
        {"select id from t where n < %", "123456789012345678901234567890.5", "1;2;"},
        {"select id from t where d > % || '-24'", "31-JAN", "1;"},
        {"select id from t where % || '-24' < d", "31-JAN", "1;"}, {"select id from t where % || '-' || '24' = d", "03-FEB", "1;"},
        {"select id from t where d > case when id = 1 then % end", "31-JAN-24", "1;"},
        {"select id from t where case when 1 = 1 then case when 1 = 1 then % end end < d", "31-JAN-24", "1;"},
        {"select id from t where case d when % then 1 end = 1", "03-FEB-24", "1;"},
        {"select case when d = % then 'x' else 'y' end as s from t", "03-FEB-24", "x;y;"},
        {"select (select count(*) from t where d = %) as n from dual", "03-FEB-24", "1;"},
        {"with x as (select id, d from t where d > %) select id from x", "01-JAN-24", "1;"},
        {"with x as (select id, d from t) select id from x where d > %", "01-JAN-24", "1;"},
        {"select id from (select id, d from t) x where x.d > %", "01-JAN-24", "1;"},
        {"select id from (select id, d as day, to_char(d, 'YYYY') d from t) x where d = '2024' and day > %", "01-JAN-24",
         "1;"},
        {"select id from (select t.*, 1 as one from t) where d > % and one = 1", "01-JAN-24", "1;"},
        {"select id from (select distinct id, trunc(d) day from t) x where x.day = %", "03-FEB-24", "1;"},
        {"with x(a, b) as (select id, d from t) select a from x where b > %", "01-JAN-24", "1;"},
        {"with x(k, a, d, e, f, g, h) as (select 1, y.* from (select n, c from u) z, (select * from t) y)"
         " select a from x where d > %", "31-JAN-24", "1;"},
        {"select id from t where coalesce(null, d) > %", "31-JAN-24", "1;"},
        {"select id from t where d = nvl(d, %) and nvl(null, nvl(d, sysdate)) > %", "31-JAN-24", "1;"},
        {"select id from t where case when id = 2 then d else % end > '31-JAN-24'", "03-FEB-24", "1;"},
        {"select id from t where d = case id when 9 then d else case id when 1 then % end end", "03-FEB-24", "1;"},
        {"with u as (select id, d from t), y as (select u.*, 1 as k from u) select id from y z where z.d > %", "01-JAN-24",
         "1;"},
        {"with recursive x(k, y) as (select id, d from t union all select k + 2, y from x where k < 3 and y > %)"
         " select k from x where k > 2", "01-JAN-24", "3;"},
        {"select id from (select id, d from t) x where x.d > % and exists (select 1 from u where d = '03-FEB-24')",
         "01-JAN-24", "1;"},
        {"select id from t where d = % union all select id from u where d = '03-FEB-24'", "03-FEB-24", "1;1;"},
        {"select id from t where d = % intersect select id from u where d = '03-FEB-24'", "03-FEB-24", "1;"},
        {"select id from t where d = % and exists (select 1 from u where d = '03-FEB-24')", "03-FEB-24", "1;"},
        {"select id from part where D = %", "03-FEB-24", "1;"},
        {"select t.id from t, u where t.d = % and u.d = '03-FEB-24'", "03-FEB-24", "1;"},
        {"select t.id from t join u x on t.d = % where x.d = '03-FEB-24'", "03-FEB-24", "1;"},
        {"select id from t where c = % or c = 'it''s'", "ab ", "1;"},
        {"select id from t where c in (select c from t where c = %)", "ab ", "1;"},
        {"with x(a, b, c, e, f, g) as (select * from few natural join t) select a from x where c = %", "03-FEB-24", "1;"},
        {"with x(a, b, c, e) as (select * from few natural left outer join (select id, n as k, d from t) y)"
         " select a from x where e = %", "03-FEB-24", "1;"},
        {"with x(a, b, c, e, f) as (select * from few join part using (ID, n) left join part z using(id))"
         " select a from x where c = %", "03-FEB-24", "1;"},
        {"with x(a, b, c) as (select * from few natural join y), y(n, id, q) as (select n, id, d from t)"
         " select a from x where c = %", "03-FEB-24", "1;"},
        {"select id from (with x(i, y) as (select id, d from t) select i as id from x where y = %) union all"
         " select k from (with x(y, k) as (select c, 7 as k from t) select k from x where y = 'ab')", "03-FEB-24", "1;7;"},
        {"select id from (with y as (select * from t), z as (select * from y) select id, d from z) x where x.d > %",
         "31-JAN-24", "1;"},
        {"with x(a, b) as (with y as (select * from t) select id, d from y) select a from x where b > %", "31-JAN-24",
         "1;"},
        {"with x as not materialized (select id, d from t) select id from x where d > %", "31-JAN-24", "1;"},
        {"with x(a, b) as materialized (select id, d from t) select a from x where b > %", "31-JAN-24", "1;"},
        {"with x(a, b) as (select 1, sysdate) select a from x where b > %", "31-JAN-24", "1;"},
        {"with u as (select id, d from t) select u.id from main.u where d = %", "03-FEB-24", "1;"},
        {"with x(a, b, c, e, f, g) as (select t.* from few join t using (id)) select a from x where b = %", "03-FEB-24",
         "1;"},
        {"select id from t where v = %", "x", "2;"}, {"select id from u where c = %", "ab", ""},
        {"select id from t where r = %", "0a", "1;"}, {"select id from t where r = x'0A' and v > %", "a", "1;"},
        {"select id from t where n = %", "5.0", "1;"}, {"select id from t where d > %", "today", "!1858"},
        {"select id from t where d = sysdate - length(%)", "x", "!932"},
        {"select id from t where d = 5 and v > %", "a", "!932"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Rows(With(c.sql, '\'' + std::string(c.text) + '\'')), c.rows) << c.sql;
        EXPECT_EQ(Rows(With(c.sql, ":x"), c.text), c.rows) << "bound: " << c.sql;
    }
}

// A condition means in a change or definition what it means in a query.
TEST_F(SqliteMeaning, ChangesFindTheRowsThatAQueryFinds) {
    MakeTables();
    const struct { const char* condition; const char* text; const char* id; } conditions[] = {
        {"d = %", "03-FEB-24", "1;"}, {"(d) = %", "03-FEB-24", "1;"}, {"c = %", "ab   ", "1;"},
        {"trunc(d) between '01-JAN-24' and %", "31-DEC-24", "1;"}, {"c in ('q', %)", "abc  ", "2;"}};
    const char* changes[] = {
        "insert into w(id) select id from t where ",
        "insert into w(id, d) select id, d from t where ",
        "insert into w(id, c) select id, c from t where id > 0 and ",
        "insert into w(id, d) with x as (select * from t) select id, d from x where ",
        "with x as (select * from t) insert into w(id, d) select id, d from x where ",
        "update w set id = (select id from t where t.d is not null and ",
    };
    for (const auto& c : conditions) {
        for (const std::string change : changes) {
            for (const bool bound : {false, true}) {
                const bool updates = change[0] == 'u';
                MustRun("create table w(id integer, d date, c char(9))");
                if (updates) MustRun("insert into w(id) values(9)");
                const std::string sql = With(change + c.condition, bound ? ":x" : '\'' + std::string(c.text) + '\'');
                EXPECT_EQ(RunBound(updates ? sql + ")" : sql, bound ? c.text : nullptr), 0) << sql;
                EXPECT_EQ(Rows("select id from w"), c.id) << sql;
                MustRun("drop table w");
            }
        }
        const std::string literal = With(c.condition, '\'' + std::string(c.text) + '\'');
        MustRun("create table w as select id from t where " + literal);
        MustRun("create view y as select id from t where " + literal);
        EXPECT_EQ(Rows("select id from w"), c.id) << literal;
        EXPECT_EQ(Rows("select id from y"), c.id) << literal;
        MustRun("drop table w", "drop view y");
    }
    EXPECT_EQ(Rows("select count(*) as n from sqlite_schema where sql like '%kelp_compare%'"), "0;");
    MustRun("delete from t where d = '03-FEB-24'");
    EXPECT_EQ(Rows("select id from t"), "2;");
}

TEST_F(SqliteMeaning, WhatCannotBeComparedRightlyIsRefused) {
    MakeTables();
    const struct { const char* sql; int number; } cases[] = {
        {"select id from t where c = 'ab' = c", 933}, {"select id from t where id < 2 = 1", 933},
        {"insert into u(id) select id from t where d = '01-JAN-24' = c", 933},
        {"select id from t natural join u where d = '03-FEB-24'", 932},
        {"select id from u natural join t where d = '03-FEB-24'", 932},
        {"select id from t where '03-FEB-24' in (1, n, d, v)", 932}, {"select id from t where '01-DEC-99' not between v and trunc(d)", 932},
        {"select case '0A' when r then 1 when v then 2 end from t", 932}, {"select id from t where '03-FEB-24' in (d, r)", 932},
        {"select id from t where 'x ' in (v, c)", 932},
        {"create view y as select id from t where d > 'today'", 1858}};
    for (const auto& c : cases) EXPECT_EQ(Run(c.sql), c.number) << c.sql;
    for (const char* right : {"select id from t where id = 1 and (n = 5) or n = 6",
                              "select case when id = 1 then 1 else 2 end from t where id = 1",
                              "select id from t where id = case id when 1 then 1 end order by id",
                              "select t.id from t join u on t.id = u.id where t.id = 1",
                              "select id from t where (id, d) = (select 1, d from t where id = 1)", "select id from t where id = 1 order by n = 5, n = 6",
                              "select id from t where id = 1 group by id having count(*) = 1",
                              "select t.id from t, u where t.id = 1 and '03-FEB-24' in (t.d, u.e, null, '1') and 'x' not in (t.v, t.c)"})
        EXPECT_EQ(Rows(right), "1;") << right;
}

// Lists without end, and subqueries that double with each level.
TEST_F(SqliteMeaning, LongStatementsTakeBoundedTime) {
    MakeTables();
    std::string list = "select id from t where d in ('03-FEB-24'";
    for (int element = 0; element < 20000; ++element) list += ", '03-FEB-24'";
    EXPECT_EQ(Rows(list + ")"), "1;");
    std::string doubled = "with x0 as (select d from t)";
    for (int level = 1; level < 11; ++level)
        doubled += ", x" + std::to_string(level) + " as (select * from x" + std::to_string(level - 1) + " a, x" +
                   std::to_string(level - 1) + " b where 1 = 0)";
    EXPECT_EQ(Rows(doubled + " select count(*) as n from x10 where d = '03-FEB-24'"), "0;");
}

TEST_F(SqliteMeaning, ExpressionsKeepTheNamesThatTheyWereGiven) {
    MakeTables();
    MUST(Prepare("select case when d = '03-FEB-24' then 1 end, c = 'ab ', id from t"), Execute(0));
    const char* names[] = {"CASE WHEN D = '03-FEB-24' THEN 1 END", "C = 'ab '", "ID"};
    for (ub4 position = 1; position <= std::size(names); ++position) {
        dvoid* parameter = nullptr;
        ASSERT_EQ(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, position), OCI_SUCCESS);
        OraText* name = nullptr;
        ub4 length = 0;
        ASSERT_EQ(OCIAttrGet(parameter, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, err), OCI_SUCCESS);
        EXPECT_EQ(std::string(reinterpret_cast<char*>(name), length), names[position - 1]);
        OCIDescriptorFree(parameter, OCI_DTYPE_PARAM);
    }
}

// Ways to store a value that are no plain values and no plain set.
TEST_F(SqliteMeaning, ValuesAreMadeToFitWhereverTheyAreStored) {
    const struct { const char* sql; const char* rows; } cases[] = {
        {"insert into w as x values(1, '03-FEB-24', 'ab')", "1,2024-02-03 00:00:00,ab   ;"},
        {"insert into w as x(id, d) values(1, '03-FEB-24')", "1,2024-02-03 00:00:00,-;"},
        {"insert into w select 1, '03-FEB-24', 'ab   '", "1,2024-02-03 00:00:00,ab   ;"},
        {"insert into w select 1, '03-FEB-24', 'ab' returning id into :x", "1,2024-02-03 00:00:00,ab   ;"},
        {"with s as (select '03-FEB-24' as d) insert into w(id, d) select 1, d from s", "1,2024-02-03 00:00:00,-;"},
        {"insert into w values(0, null, 'q') on conflict(id) do update set d = '03-FEB-24', c = 'ab'",
         "0,2024-02-03 00:00:00,ab   ;"},
        {"insert into w values(0, '03-FEB-24', 'q') on conflict(id) do update set d = excluded.d"
         " where excluded.d < '01-JAN-25' and w.d is null",
         "0,2024-02-03 00:00:00,-;"},
        {"insert into w select 0, null, 'q' where 1 = 1 on conflict(id) do update set d = '03-FEB-24'",
         "0,2024-02-03 00:00:00,-;"},
        {"update w set (d, c) = ('03-FEB-24', 'ab')", "0,2024-02-03 00:00:00,ab   ;"},
        {"update w set (d, c) = (select '03-FEB-24', 'ab   ')", "0,2024-02-03 00:00:00,ab   ;"},
        {"update w set (d, c) = (with s as (select '03-FEB-24' as d) select d, 'ab   ' from s)",
         "0,2024-02-03 00:00:00,ab   ;"},
        {"update w set d = (select '03-FEB-24')", "0,2024-02-03 00:00:00,-;"},
        {"insert into w values(1, '30-FEB-24', 'ab')", "!1839"},
        {"with s as (select 'abcdef' as c) insert into w(id, c) select 1, c from s", "!12899"},
        {"update w set (d, c) = (select 'x', null)", "!1858"},
    };
    for (const auto& c : cases) {
        MustRun("create table w(id integer primary key, d date, c char(5))");
        const std::string sql = c.sql;
        const bool inserts = sql.find("insert") != std::string::npos && sql.find("conflict") == std::string::npos;
        if (!inserts) MustRun("insert into w(id) values(0)");
        char id[10] = "";
        sb4 error = Prepare(sql);
        if (error == 0 && sql.find(":x") != std::string::npos) error = Bind(1, {id, sizeof id, SQLT_STR});
        if (error == 0) error = Execute();
        EXPECT_EQ(error == 0 ? Rows("select id, d || '' as d, c from w") : "!" + std::to_string(error), c.rows) << sql;
        MustRun("drop table w");
    }
}

// What a column of the query is described as, before anything is fetched.
struct Described { std::string name; int type, size, precision, scale, characters; bool counts_characters; };
bool operator==(const Described& left, const Described& right) {
    const auto tied = [](const Described& d) {
        return std::tie(d.name, d.type, d.size, d.precision, d.scale, d.characters, d.counts_characters);
    };
    return tied(left) == tied(right);
}
std::ostream& operator<<(std::ostream& out, const Described& d) {
    return out << d.name << " type " << d.type << " size " << d.size << " precision " << d.precision << " scale "
               << d.scale << " characters " << d.characters << (d.counts_characters ? " counted" : "");
}

class SqliteDescribes : public SqliteMeaning {
protected:
    std::vector<Described> Describe(std::string_view sql, ub4 mode = OCI_DESCRIBE_ONLY) {
        std::vector<Described> columns;
        EXPECT_EQ(Prepare(sql), 0);
        EXPECT_EQ(Execute(0, mode), 0) << sql;
        const ub4 count = Attribute<ub4>(OCI_ATTR_PARAM_COUNT);
        for (ub4 position = 1; position <= count; ++position) {
            dvoid* parameter = nullptr;
            EXPECT_EQ(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, position), OCI_SUCCESS);
            OraText* name = nullptr;
            ub4 length = 0;
            EXPECT_EQ(OCIAttrGet(parameter, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, err), OCI_SUCCESS);
            columns.push_back({std::string(reinterpret_cast<char*>(name), length),
                               Attribute<ub2>(OCI_ATTR_DATA_TYPE, parameter, OCI_DTYPE_PARAM),
                               Attribute<ub2>(OCI_ATTR_DATA_SIZE, parameter, OCI_DTYPE_PARAM),
                               Attribute<ub2>(OCI_ATTR_PRECISION, parameter, OCI_DTYPE_PARAM),
                               Attribute<sb1>(OCI_ATTR_SCALE, parameter, OCI_DTYPE_PARAM),
                               Attribute<ub2>(OCI_ATTR_CHAR_SIZE, parameter, OCI_DTYPE_PARAM),
                               Attribute<ub1>(OCI_ATTR_CHAR_USED, parameter, OCI_DTYPE_PARAM) != 0});
            OCIDescriptorFree(parameter, OCI_DTYPE_PARAM);
        }
        return columns;
    }
    int TypeOf(const std::string& expression, const char* from = "t") {
        const auto columns = Describe("select " + expression + " from " + from);
        return columns.size() == 1 ? columns[0].type : -1;
    }
};

TEST_F(SqliteDescribes, NumbersBeforeTheyAreKnownAndOverNoRows) {
    MustRun("create table t(a number(5), b varchar2(9), d date)");
    for (const char* number : {"count(*)", "sum(a)", "a+1", "5", ".5", "-a", "1.5e3", "(a * 2)", "a + 1 x", "count(b) as n",
                               "avg(a) - 1", "length(b)", "count(*) filter (where a > 1)",
                               "round(a, 2)", "to_number(b) + :x", "sum(a) over (partition by b) c", "a % 2", "max(5)"}) {
        EXPECT_EQ(TypeOf(number), SQLT_NUM) << number;
        EXPECT_EQ(Describe(std::string("select ") + number + " from dual, t").size(), 1u);
    }
    for (const char* text : {"b", "b || 'x'", "'5'", "1 || 2", "case when a = 1 then 'x' end", "b x", "to_char(a + 1)"})
        EXPECT_EQ(TypeOf(text), SQLT_CHR) << text;
    for (const char* date : {"d", "trunc(last_day(d))", "sysdate", "sysdate x", "add_months(d, 1 + 1) as y"})
        EXPECT_EQ(TypeOf(date), SQLT_DAT) << date;
    MustRun("create table one(b varchar2(9))");
    EXPECT_EQ(TypeOf("one.*", "one"), SQLT_CHR);
}

TEST_F(SqliteDescribes, RowIdsByAnotherName) {
    MustRun("create table t(a integer primary key)");
    const struct { const char* item; const char* name; int type; } cases[] = {
        {"rowid", "ROWID", SQLT_RDD}, {"t.rowid", "ROWID", SQLT_RDD}, {"rowid as r", "R", SQLT_RDD},
        {"rowid r", "R", SQLT_RDD}, {"t.rowid \"Row\"", "Row", SQLT_RDD}};
    for (const auto& c : cases) {
        const auto columns = Describe(std::string("select ") + c.item + " from t");
        ASSERT_EQ(columns.size(), 1u);
        EXPECT_EQ(columns[0].name, c.name);
        EXPECT_EQ(columns[0].type, c.type) << c.item;
    }
}

TEST_F(SqliteDescribes, NativeFloatsAndDoubles) {
    MustRun("create table t(f binary_float, d binary_double)", "insert into t values(16777217, 0.1)");
    const auto columns = Describe("select f, d, cast(f as binary_double) c from t");
    ASSERT_EQ(columns.size(), 3u);
    EXPECT_EQ(columns[0], (Described{"F", SQLT_IBFLOAT, 4, 0, 0, 0, false}));
    EXPECT_EQ(columns[1], (Described{"D", SQLT_IBDOUBLE, 8, 0, 0, 0, false}));
    EXPECT_EQ(columns[2].type, SQLT_IBDOUBLE);
    EXPECT_EQ(Rows("select f, d from t"), "16777216,.1;");
    EXPECT_EQ(Rows("select cast(16777217 as binary_float), cast('16777217' as binary_double), "
                   "cast(null as binary_float) from dual"), "16777216,16777217,-;");
    EXPECT_EQ(Rows("select cast(1e39 as binary_float) from dual"), "!1426");
}

TEST_F(SqliteDescribes, SizesInCharactersAndInBytes) {
    MustRun("create table t(a varchar2(3), b varchar2(3 byte), c varchar2(3 char), d nvarchar2(3), e char(3), "
            "f char(3 char), g nchar(3), h nchar)");
    const Described expected[] = {{"A", SQLT_CHR, 3, 0, 0, 3, false},  {"B", SQLT_CHR, 3, 0, 0, 3, false},
                                  {"C", SQLT_CHR, 12, 0, 0, 3, true},  {"D", SQLT_CHR, 12, 0, 0, 3, true},
                                  {"E", SQLT_AFC, 3, 0, 0, 3, false},  {"F", SQLT_AFC, 12, 0, 0, 3, true},
                                  {"G", SQLT_AFC, 12, 0, 0, 3, true},  {"H", SQLT_AFC, 4, 0, 0, 1, true}};
    const auto columns = Describe("select * from t");
    ASSERT_EQ(columns.size(), std::size(expected));
    for (std::size_t index = 0; index < columns.size(); ++index) EXPECT_EQ(columns[index], expected[index]);

    const struct { const char* column; const char* value; const char* kept; } cases[] = {
        {"a", "äx", "äx"}, {"a", "äxy", "!12899"}, {"b", "äxy", "!12899"},
        {"c", "äöü", "äöü"}, {"c", "äöüx", "!12899"}, {"d", "äöü", "äöü"}, {"d", "abcd", "!12899"},
        {"e", "ä", "ä "}, {"e", "äö", "!12899"}, {"f", "ä", "ä  "}, {"f", "äöü", "äöü"}, {"f", "äöüx", "!12899"},
        {"g", "ä", "ä  "}, {"g", "äöüx", "!12899"}, {"h", "ä", "ä"}, {"h", "äö", "!12899"}};
    for (const auto& c : cases) {
        const std::string column = c.column;
        for (const bool bound : {true, false}) {
            MustRun("delete from t");
            const std::string value = bound ? ":x" : "'" + std::string(c.value) + "'";
            const sb4 error = RunBound("insert into t(" + column + ") values(" + value + ")", bound ? c.value : nullptr);
            const std::string kept = error != 0 ? "!" + std::to_string(error) + ";" : Rows("select " + column + " from t");
            EXPECT_EQ(kept, std::string(c.kept) + ";") << column << ' ' << c.value;
        }
    }
    const struct { const char* cast; const char* text; const char* name; } casts[] = {
        {"cast('äöü' as varchar2(2))", "ä;", "CAST('äöü' AS VARCHAR2(2))"},
        {"cast('äöü' as varchar2(3))", "ä;", "CAST('äöü' AS VARCHAR2(3))"},
        {"cast('äöü' as varchar2(2 char))", "äö;", "CAST('äöü' AS VARCHAR2(2 CHAR))"},
        {"cast('äöü' as nvarchar2(2))", "äö;", "CAST('äöü' AS NVARCHAR2(2))"},
        {"cast('1 2:3:4.56' as interval day(4) to second(1))", "+0001 02:03:04.6;", "CAST('1 2:3:4.56' AS INTERVAL DAY(4) TO SECOND(1))"},
        {"cast('ä' as char(3)) || '.'", "ä .;", "CAST('ä' AS CHARACTER(3)) || '.'"},
        {"cast('ä' as nchar(3)) || '.'", "ä  .;", "CAST('ä' AS NCHAR(3)) || '.'"}};
    for (const auto& c : casts) {
        EXPECT_EQ(Rows(std::string("select ") + c.cast + " from dual"), c.text) << c.cast;
        EXPECT_EQ(Describe(std::string("select ") + c.cast + " from dual")[0].name, c.name);
    }
}

TEST_F(SqliteMeaning, FractionsAreRoundedToTheColumnsDigits) {
    const struct { const char* type; const char* written; const char* kept; } cases[] = {
        {"timestamp(0)", "2024-02-28 23:59:59.5", "2024-02-29 00:00:00"},
        {"timestamp(0)", "2024-02-28 23:59:59.499999999", "2024-02-28 23:59:59"},
        {"timestamp(3)", "2024-12-31 23:59:59.9995", "2025-01-01 00:00:00"},
        {"timestamp(3)", "2024-01-01 00:00:00.0004999", "2024-01-01 00:00:00"},
        {"timestamp", "2024-01-01 00:00:00.1234565", "2024-01-01 00:00:00.123457"},
        {"timestamp(8)", "2024-01-01 00:00:00.123456785", "2024-01-01 00:00:00.12345679"},
        {"timestamp(9)", "2024-01-01 00:00:00.123456785", "2024-01-01 00:00:00.123456785"},
        {"timestamp(1) with time zone", "2024-01-01 00:00:00.95 +01:00", "2024-01-01 00:00:01 +01:00"},
        {"date", "2024-01-01 23:59:59.9", "2024-01-01 23:59:59"},
        {"timestamp(3)", "9999-12-31 23:59:59.9999", "!1841"}};
    for (const auto& c : cases) {
        const std::string literal = "'" + std::string(c.written) + "'";
        MustRun("create table t(s " + std::string(c.type) + ")");
        for (const char* sql : {"insert into t values(%)", "insert into t select % from dual",
                                "insert into t values(timestamp %)"}) {
            MustRun("delete from t");
            const std::string text = With(sql, literal);
            const sb4 error = Run(text);
            EXPECT_EQ(error != 0 ? "!" + std::to_string(error) : Rows("select s || '' as s from t"),
                      c.kept[0] == '!' ? c.kept : c.kept + std::string(";"))
                << text << " into " << c.type;
        }
        EXPECT_EQ(One("select cast(" + literal + " as " + c.type + ") || '' from dual"), c.kept) << c.type;
        MustRun("drop table t");
    }
    MustRun("create table t(s timestamp(0))", "insert into t values('2024-01-01 00:00:00')");
    EXPECT_EQ(Rows("select count(*) as n from t where s < '01-JAN-24 12.00.00.4 AM'"), "1;") << "what is compared is not";
}

TEST_F(SqliteMeaning, DefaultsAreExpressions) {
    MustRun("create table t(id number, a number default 1 + 1, b date default to_date('09-FEB-24'), "
            "c date default sysdate not null, d varchar2(9) default 'x' || 'y', e number default -1, "
            "f date default date '2024-02-09', g number default (2) * 3 check (g < 10))");
    MustRun("insert into t(id) values(1)");
    EXPECT_EQ(Rows("select a, d, e, g from t"), "2,xy,-1,6;");
    EXPECT_EQ(Rows("select b, f, case when c > '01-JAN-20' then 'now' end from t"), "09-FEB-24,09-FEB-24,now;");
    MustRun("alter table t add h number default 3");
    EXPECT_EQ(Rows("select h from t"), "3;");
    EXPECT_EQ(Run("create table u(a varchar2(9) default nobody)"), 900) << "no text without quotes";

    const struct { const char* column; const char* kept; } cases[] = {
        {"date default '09-FEB-24'", "2024-02-09 00:00:00"}, {"date not null default '09-FEB-24' unique", "2024-02-09 00:00:00"},
        {"timestamp(1) default '2024-02-09 00:00:00.25'", "2024-02-09 00:00:00.3"}, {"char(3) default 'ab   '", "ab"},
        {"number(5,2) default 1.005", "1.01"}, {"number(5,2) default '-1.005'", "-1.01"}, {"number default -7", "-7"},
        {"binary_float default 16777217", "16777216.0"}, {"varchar2(2) default 'it''s'", "!12899"},
        {"varchar2(4) default 'it''s'", "it's"}, {"date default 'today'", "!1858"}, {"date default 5", "!932"},
        {"number(3) default 1000", "!1438"}, {"raw(2) default '0aFF' check (length(a) > 0)", "\x0a\xff"},
        {"date default null", "-"}};
    for (const auto& c : cases) {
        const std::string column = c.column;
        const sb4 error = Run("create table u(id number, a " + column + ", z number(1) default 2)");
        if (error == 0) MustRun("insert into u(id) values(1)");
        const std::string kept = error != 0 ? "!" + std::to_string(error) : Rows("select cast(a as text) as a from u");
        EXPECT_EQ(kept, c.kept[0] == '!' ? c.kept : c.kept + std::string(";")) << column;
        if (error == 0) MustRun("drop table u");
    }
    MustRun("create table u(id number)", "alter table u add column d date default '09-FEB-24'",
            "insert into u(id) values(1)");
    EXPECT_EQ(Rows("select d || '' as d from u"), "2024-02-09 00:00:00;");
}

TEST_F(SqliteMeaning, OnlyStatementsOfApplicationsReachTheEngine) {
    MustRun("create table t(a number)");
    for (const char* sql : {"end", "end transaction", "vacuum", "attach ':memory:' as other", "detach main", "reindex",
                            "pragma foreign_keys = off", "PRAGMA query_only = 1", "explain pragma query_only = 1", "-- nothing"}) {
        MustRun("insert into t values(1)");
        EXPECT_EQ(Run(sql), 900) << sql;
        MustRun("rollback");
        EXPECT_EQ(Rows("select count(*) as n from t"), "0;") << sql << " has committed";
    }
    MustRun("insert into t values(1)");
}

TEST_F(SqliteMeaning, TooFewAndTooManyValues) {
    MustRun("create table t(a number, b number)");
    EXPECT_EQ(Run("insert into t(a, b) values(1)"), 947);
    EXPECT_EQ(Run("insert into t(a, b) values(1, 2, 3)"), 913);
    EXPECT_EQ(Run("insert into t(a, b) select 1 from dual"), 947);
    EXPECT_EQ(Run("insert into t(a) select 1, 2 from dual"), 913);
    EXPECT_EQ(Run("insert into t values(1)"), 947);
    EXPECT_EQ(Run("insert into t values(1, 2, 3)"), 913);
}

TEST_F(SqliteMeaning, FunctionsAtTheirEdges) {
    const struct { const char* expression; const char* value; } cases[] = {
        {"initcap('1st 2ND o''neil')", "1st 2nd O'Neil"},
        {"instr('abc', 'a', -3)", "1"}, {"instr('abc', 'a', -4)", "0"}, {"instr('abc', 'c', 3)", "3"},
        {"nvl2(1, 'there', 'null')", "there"}, {"nvl2(null, 'there', 'null')", "null"},
        {"cast('äb' as char(1 char)) || cast('ab' as char)", "äa"},
        {"instr('abc', 'c', 4)", "0"}, {"'[' || decode(cast('   ' as char(3)), '   ', 'same') || ']'", "[same]"},
    };
    for (const auto& c : cases) EXPECT_EQ(One(std::string("select ") + c.expression + " from dual"), c.value) << c.expression;
    MustRun("create table t(c char(3))", "insert into t select '   ' from dual");
    EXPECT_EQ(Rows("select '[' || c || ']' as x, length(c) as n from t where c is not null"), "[ ],1;");
    EXPECT_EQ(Rows("select c from t"), "   ;");
}

// The object of the row that took another's place is in the table; that of the other is gone.
TEST_F(SqliteMeaning, ReplacedRowsReturnTheirObjects) {
    MustRun("create table l(k integer primary key, c clob)", "insert into l values(1, 'old')", "commit");
    auto* lob = NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
    auto* old = NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
    char data[] = "w";
    const auto write = [&](OCILobLocator* to) {
        ub4 amount = 1;
        return Answer(OCILobWrite(svc, err, to, &amount, 3, data, 1, OCI_ONE_PIECE, nullptr, nullptr, 0, 0));
    };
    for (const char* sql : {"insert or replace into l values(1, 'nee') returning c into :1",
                            "replace into l values(1, 'nee') returning c into :1",
                            "update or replace l set c = 'nee' where k = 1 returning c into :1"}) {
        MUST(Query("select c from l for update", {{&old, -1, SQLT_CLOB}}), write(old));
        MUST(Ready(sql, {{&lob, -1, SQLT_CLOB}}), Execute(), write(lob));
        EXPECT_EQ(One("select c from l"), "new") << sql;
        EXPECT_EQ(write(old), sql[0] == 'u' ? 0 : 22922) << sql;
    }
}

}  // namespace
