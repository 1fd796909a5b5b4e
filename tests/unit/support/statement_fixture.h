// A session on a private database, in memory or, with KELP_TEST_ENGINE=postgres, on the server of the test run; and short
// forms of the calls on statements. Answers are 0 or the number of
// the first record, so that a test reads like a table of numbers.
#pragma once

#include <gtest/gtest.h>

#include <array>
#include <cstring>
#include <memory>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "kelpci.h"
#include "oci.h"
#include "support/must.h"
#include "support/postgres_database.h"

// The calls, on handles that each thread may have of its own.
struct StatementCalls {
    template <class T>
    T* New(ub4 type) const {
        dvoid* handle = nullptr;
        EXPECT_EQ(OCIHandleAlloc(env, &handle, type, 0, nullptr), OCI_SUCCESS) << type;
        return static_cast<T*>(handle);
    }
    template <class T>
    T* NewDescriptor(ub4 type) const {
        dvoid* descriptor = nullptr;
        EXPECT_EQ(OCIDescriptorAlloc(env, &descriptor, type, 0, nullptr), OCI_SUCCESS) << type;
        return static_cast<T*>(descriptor);
    }

    // The application's form of a text: UTF-16 where the environment has that. ASCII only.
    [[nodiscard]] std::string Encoded(std::string_view text) const {
        std::string encoded;
        for (const char c : text) {
            encoded += c;
            if (mode_ & OCI_UTF16) encoded += '\0';
        }
        return encoded;
    }
    static const OraText* Bytes(std::string_view text) { return reinterpret_cast<const OraText*>(text.data()); }
    static ub4 Size(std::string_view text) { return static_cast<ub4>(text.size()); }

    sword Logon(OCISvcCtx** context) const {
        const std::string database = Encoded(database_);
        return OCILogon(env, err, context, nullptr, 0, nullptr, 0, Bytes(database), Size(database));
    }
    sb4 Answer(sword rc) const {
        sb4 number = 0;
        if (rc == OCI_SUCCESS) return 0;
        return OCIErrorGet(err, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR) == OCI_SUCCESS ? number : rc;
    }
    sb4 Prepare(OCIStmt* statement, std::string_view sql) const {
        const std::string text = Encoded(sql);
        return Answer(OCIStmtPrepare(statement, err, Bytes(text), Size(text), OCI_NTV_SYNTAX, OCI_DEFAULT));
    }
    sb4 Prepare(std::string_view sql) const { return Prepare(stmt, sql); }
    // Two calls as they answer, for what is told by the return code alone.
    sword ExecuteCode(ub4 iterations = 1, ub4 mode = OCI_DEFAULT, ub4 first = 0) const {
        return OCIStmtExecute(svc, stmt, err, iterations, first, nullptr, nullptr, mode);
    }
    sword FetchCode(ub4 rows = 1) const { return OCIStmtFetch(stmt, err, rows, OCI_FETCH_NEXT, OCI_DEFAULT); }
    sb4 Execute(ub4 iterations = 1, ub4 mode = OCI_DEFAULT, ub4 first = 0) const {
        return Answer(ExecuteCode(iterations, mode, first));
    }
    // Prepares and executes something that is no query.
    sb4 Run(std::string_view sql) const {
        const sb4 prepared = Prepare(sql);
        return prepared != 0 ? prepared : Execute();
    }
    template <class... Sql>
    void MustRun(const Sql&... texts) const {
        for (const std::string_view sql : {std::string_view(texts)...}) ASSERT_EQ(Run(sql), 0) << sql;
    }

    struct Area {
        dvoid* value;
        sb4 size;
        ub2 type;
        sb2* indicators = nullptr;
        ub2* lengths = nullptr;
        ub2* codes = nullptr;
        ub4 mode = OCI_DEFAULT;
    };
    // Whole numbers, one or an array of them; terminated text, one or an array; and a value that comes in pieces.
    template <class T>
    static Area Int(T& place) { return {&place, sizeof(std::remove_all_extents_t<T>), SQLT_INT}; }
    template <class T, std::size_t N>
    static Area Int(std::array<T, N>& places) { return {places.data(), sizeof(T), SQLT_INT}; }
    template <class T>
    static Area Text(T& place, sb2* indicators = nullptr, ub2* lengths = nullptr, ub2* codes = nullptr) {
        constexpr std::size_t size = std::rank_v<T> == 2 ? std::extent_v<T, 1> : sizeof(T);
        return {&place, size, SQLT_STR, indicators, lengths, codes};
    }
    static Area InPieces(ub2 type, sb2* indicator = nullptr, ub2* code = nullptr) {
        return {nullptr, 4000, type, indicator, nullptr, code, OCI_DYNAMIC_FETCH};    // the same bit as for binds
    }

    sb4 Bind(OCIBind** bind, ub4 position, const Area& area, ub4 mode = OCI_DEFAULT, ub4 most = 0,
             ub4* current = nullptr) {
        return Answer(OCIBindByPos(stmt, bind, err, position, area.value, area.size, area.type, area.indicators,
                                   area.lengths, area.codes, most, current, area.mode | mode));
    }
    sb4 Bind(ub4 position, const Area& area, ub4 mode = OCI_DEFAULT, ub4 most = 0, ub4* current = nullptr) {
        OCIBind* bind = nullptr;
        return Bind(&bind, position, area, mode, most, current);
    }
    sb4 BindName(OCIBind** bind, std::string_view name, const Area& area, ub4 most = 0, ub4* current = nullptr) {
        const std::string text = Encoded(name);
        return Answer(OCIBindByName(stmt, bind, err, Bytes(text), static_cast<sb4>(text.size()), area.value, area.size,
                                    area.type, area.indicators, area.lengths, area.codes, most, current, area.mode));
    }
    sb4 BindName(std::string_view name, const Area& area, ub4 most = 0, ub4* current = nullptr) {
        OCIBind* bind = nullptr;
        return BindName(&bind, name, area, most, current);
    }
    sb4 Define(OCIDefine** define, ub4 position, const Area& area, ub4 mode = OCI_DEFAULT) {
        return Answer(OCIDefineByPos(stmt, define, err, position, area.value, area.size, area.type, area.indicators,
                                     area.lengths, area.codes, area.mode | mode));
    }
    sb4 Define(ub4 position, const Area& area, ub4 mode = OCI_DEFAULT) {
        OCIDefine* define = nullptr;
        return Define(&define, position, area, mode);
    }
    // Prepares and binds the positions from 1 on.
    sb4 Ready(std::string_view sql, std::initializer_list<Area> binds) {
        sb4 answer = Prepare(sql);
        ub4 position = 0;
        for (const Area& area : binds) answer = answer == 0 ? Bind(++position, area) : answer;
        return answer;
    }
    // Prepares a query, defines its columns from 1 on, and executes it for so many rows.
    sb4 Query(std::string_view sql, std::initializer_list<Area> columns, ub4 rows = 1, ub4 mode = OCI_DEFAULT) {
        sb4 answer = Prepare(sql);
        ub4 position = 0;
        for (const Area& area : columns) answer = answer == 0 ? Define(++position, area) : answer;
        return answer == 0 ? Execute(rows, mode) : answer;
    }
    sb4 Fetch(ub4 rows = 1, ub2 orientation = OCI_FETCH_NEXT, sb4 offset = 0) const {
        return Answer(OCIStmtFetch2(stmt, err, rows, orientation, offset, OCI_DEFAULT));
    }

    // The query's first value as text, "-" for a null, "!" and the number for an error.
    std::string One(std::string_view sql) {
        OCIStmt* const outer = stmt;
        stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        char text[4001] = "";
        sb2 indicator = 0;
        const sb4 answer = Query(sql, {Text(text, &indicator)});
        OCIHandleFree(stmt, OCI_HTYPE_STMT);
        stmt = outer;
        if (answer != 0) return "!" + std::to_string(answer);
        return indicator == -1 ? "-" : text;
    }
    template <class T>
    T Attribute(ub4 attribute, const dvoid* handle = nullptr, ub4 type = OCI_HTYPE_STMT) const {
        T value{};
        EXPECT_EQ(Answer(OCIAttrGet(handle ? handle : stmt, type, &value, nullptr, attribute, err)), 0) << attribute;
        return value;
    }

    dvoid* Column(ub4 position) const {
        dvoid* parameter = nullptr;
        EXPECT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, position)), 0) << position;
        return parameter;
    }
    std::string_view ColumnName(dvoid* parameter) const {
        OraText* name = nullptr;
        ub4 length = 0;
        EXPECT_EQ(Answer(OCIAttrGet(parameter, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, err)), 0);
        return {reinterpret_cast<const char*>(name), length};
    }
    ub4 RowCount() const { return Attribute<ub4>(OCI_ATTR_ROW_COUNT); }
    ub4 RowsFetched() const { return Attribute<ub4>(OCI_ATTR_ROWS_FETCHED); }
    ub4 State() const { return Attribute<ub4>(OCI_ATTR_STMT_STATE); }
    ub4 FailedRow() const { return Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, err, OCI_HTYPE_ERROR); }

    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCISvcCtx* svc = nullptr;
    OCIStmt* stmt = nullptr;
    ub4 mode_ = OCI_DEFAULT;
    std::string database_ = ":memory:";
};

class StatementTest : public testing::Test, protected StatementCalls {
protected:
    explicit StatementTest(ub4 mode = OCI_DEFAULT) { mode_ = mode; }

    void SetUp() override {
        server_ = ServerOfTheTest();
        if (server_) database_ = server_->Url();
        ASSERT_EQ(OCIEnvCreate(&env, mode_, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
        err = New<OCIError>(OCI_HTYPE_ERROR);
        ASSERT_EQ(Logon(&svc), OCI_SUCCESS);
        stmt = New<OCIStmt>(OCI_HTYPE_STMT);
    }
    void TearDown() override {
        OCILogoff(svc, err);
        EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(OCI_memGetMemCount(), 0) << "blocks left behind";
    }
    using StatementCalls::Run;    // and not the base's
    // Handles for another thread of the same session.
    [[nodiscard]] StatementCalls Another() const {
        return {env, New<OCIError>(OCI_HTYPE_ERROR), svc, New<OCIStmt>(OCI_HTYPE_STMT), mode_, database_};
    }
    [[nodiscard]] bool OnServer() const { return server_ != nullptr; }    // what is the embedded engine's alone is asked there

private:
    std::unique_ptr<PostgresDatabase> server_;
};
