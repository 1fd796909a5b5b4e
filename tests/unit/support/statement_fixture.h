// A session on a private database in memory, and short forms of the calls on statements. Answers are 0 or the number of
// the first record, so that a test reads like a table of numbers.
#pragma once

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include "kelpci.h"
#include "oci.h"

class StatementTest : public testing::Test {
protected:
    explicit StatementTest(ub4 mode = OCI_DEFAULT) : mode_(mode) {}

    void SetUp() override {
        ASSERT_EQ(OCIEnvCreate(&env, mode_, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
        err = New<OCIError>(OCI_HTYPE_ERROR);
        const std::string database = Encoded(":memory:");
        ASSERT_EQ(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, Bytes(database), Size(database)), OCI_SUCCESS);
        stmt = New<OCIStmt>(OCI_HTYPE_STMT);
    }
    void TearDown() override {
        OCILogoff(svc, err);
        EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(OCI_memGetMemCount(), 0) << "blocks left behind";
    }

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
    static const OraText* Bytes(const std::string& text) { return reinterpret_cast<const OraText*>(text.data()); }
    static ub4 Size(const std::string& text) { return static_cast<ub4>(text.size()); }

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
    sb4 Execute(ub4 iterations = 1, ub4 mode = OCI_DEFAULT, ub4 first = 0) const {
        return Answer(OCIStmtExecute(svc, stmt, err, iterations, first, nullptr, nullptr, mode));
    }
    // Prepares and executes something that is no query.
    sb4 Run(std::string_view sql) const {
        const sb4 prepared = Prepare(sql);
        return prepared != 0 ? prepared : Execute();
    }
    void MustRun(std::string_view sql) const { ASSERT_EQ(Run(sql), 0) << sql; }

    struct Area {
        dvoid* value;
        sb4 size;
        ub2 type;
        sb2* indicators = nullptr;
        ub2* lengths = nullptr;
        ub2* codes = nullptr;
    };
    sb4 Bind(ub4 position, const Area& area, ub4 mode = OCI_DEFAULT, ub4 most = 0, ub4* current = nullptr) {
        OCIBind* bind = nullptr;
        return Answer(OCIBindByPos(stmt, &bind, err, position, area.value, area.size, area.type, area.indicators,
                                   area.lengths, area.codes, most, current, mode));
    }
    sb4 BindName(std::string_view name, const Area& area, ub4 most = 0, ub4* current = nullptr) {
        OCIBind* bind = nullptr;
        const std::string text = Encoded(name);
        return Answer(OCIBindByName(stmt, &bind, err, Bytes(text), static_cast<sb4>(text.size()), area.value, area.size,
                                    area.type, area.indicators, area.lengths, area.codes, most, current, OCI_DEFAULT));
    }
    sb4 Define(ub4 position, const Area& area, ub4 mode = OCI_DEFAULT) {
        OCIDefine* define = nullptr;
        return Answer(OCIDefineByPos(stmt, &define, err, position, area.value, area.size, area.type, area.indicators,
                                     area.lengths, area.codes, mode));
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
        sb4 answer = Prepare(sql);
        if (answer == 0) answer = Define(1, {text, sizeof text, SQLT_STR, &indicator});
        if (answer == 0) answer = Execute(1);
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

    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCISvcCtx* svc = nullptr;
    OCIStmt* stmt = nullptr;

private:
    ub4 mode_;
};
