// An environment with an error handle, for tests that call the library as an application does.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <string_view>

#include "kelpci.h"
#include "oci.h"
#include "support/must.h"
#include "support/postgres_database.h"

constexpr ub4 kHuge = 0xFFFFFFFF;    // a length that nobody means

inline OCIEnv* NewEnvironment(ub4 mode = OCI_DEFAULT) {
    OCIEnv* env = nullptr;
    EXPECT_EQ(OCIEnvCreate(&env, mode, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
    return env;
}
template <class T>
T* NewHandle(OCIEnv* env, ub4 type) {
    dvoid* handle = nullptr;
    EXPECT_EQ(OCIHandleAlloc(env, &handle, type, 0, nullptr), OCI_SUCCESS) << type;
    return static_cast<T*>(handle);
}
// The number of a handle's first record, 0 without one.
inline sb4 FirstCode(dvoid* handle, ub4 type = OCI_HTYPE_ERROR) {
    sb4 code = 0;
    return OCIErrorGet(handle, 1, nullptr, &code, nullptr, 0, type) == OCI_SUCCESS ? code : 0;
}
inline OraText* Text(const char* text) { return reinterpret_cast<OraText*>(const_cast<char*>(text)); }
inline OraText* Text(std::string_view text) { return Text(text.data()); }
inline OraText* Text(std::u16string_view text) {
    return reinterpret_cast<OraText*>(const_cast<char16_t*>(text.data()));
}
inline ub4 Length(const char* text) { return text ? static_cast<ub4>(std::strlen(text)) : 0; }

class CallFixture : public testing::Test {
protected:
    explicit CallFixture(ub4 mode = OCI_DEFAULT) : mode_(mode) {}

    void SetUp() override { Open(mode_); }
    void TearDown() override {
        Close();
        EXPECT_EQ(OCI_memGetMemCount(), 0) << "blocks left behind";
        if (!folder_.empty()) std::filesystem::remove_all(folder_);
    }
    // A folder of the test's own, where databases lie that are named without one.
    const std::string& Folder() {
        if (folder_.empty()) {
            char name[] = "/tmp/kelp-calls-XXXXXX";
            folder_ = mkdtemp(name);
            setenv("KELPCI_HOME", name, 1);
        }
        return folder_;
    }

    // A database, which ann may log on to: in the folder or, with KELP_TEST_ENGINE=postgres, on the server of the
    // test run.
    void MakeDatabase(const char* name = "work") {
        const char* const engine = std::getenv("KELP_TEST_ENGINE");
        const std::string ini = Folder() + "/kelpcli.ini";
        if (!engine || std::string_view(engine) != "postgres") return;
        server_ = std::make_unique<PostgresDatabase>();
        ann_ = server_->Owner();
        std::ofstream(ini) << '[' << name << "]\nurl=" << server_->Url() << '\n';
    }
    [[nodiscard]] bool OnServer() const { return server_ != nullptr; }

    void Open(ub4 mode) {
        env_ = NewEnvironment(mode);
        err_ = New<OCIError>(OCI_HTYPE_ERROR);
    }
    void Close() {
        EXPECT_EQ(OCIHandleFree(env_, OCI_HTYPE_ENV), OCI_SUCCESS);
        env_ = nullptr;
    }
    void Reopen(ub4 mode) {
        Close();
        Open(mode);
    }

    template <class T>
    T* New(ub4 type) const {
        return NewHandle<T>(env_, type);
    }
    template <class T>
    T* NewDescriptor(ub4 type) const {
        dvoid* descriptor = nullptr;
        EXPECT_EQ(OCIDescriptorAlloc(env_, &descriptor, type, 0, nullptr), OCI_SUCCESS) << type;
        return static_cast<T*>(descriptor);
    }
    // The record's number after OCI_ERROR; else the return code.
    static sb4 Answer(sword code, OCIError* err) {
        const sb4 number = code == OCI_ERROR ? FirstCode(err) : 0;
        return number != 0 ? number : code;
    }
    [[nodiscard]] sb4 Answer(sword code) const { return Answer(code, err_); }

    // Without a user by the means of the system.
    sb4 LogOn(OCISvcCtx** svc, const char* database, const char* user = nullptr, const char* password = nullptr) const {
        return Answer(OCILogon(env_, err_, svc, Text(user), Length(user), Text(password), Length(password),
                               Text(database), Length(database)));
    }
    sb4 Run(OCISvcCtx* svc, OCIStmt* stmt, OCIError* err, const char* sql, ub4 iterations) const {
        const sword code = OCIStmtPrepare(stmt, err, Text(sql), Length(sql), OCI_NTV_SYNTAX, OCI_DEFAULT);
        if (code != OCI_SUCCESS) return Answer(code, err);
        return Answer(OCIStmtExecute(svc, stmt, err, iterations, 0, nullptr, nullptr, OCI_DEFAULT), err);
    }
    // In a statement of its own.
    sb4 Run(OCISvcCtx* svc, const char* sql) const {
        auto* stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        const sb4 answer = Run(svc, stmt, err_, sql, 1);
        OCIHandleFree(stmt, OCI_HTYPE_STMT);
        return answer;
    }
    template <class T>
    T Attribute(const dvoid* handle, ub4 type, ub4 attribute) const {
        T value{};
        EXPECT_EQ(Answer(OCIAttrGet(handle, type, &value, nullptr, attribute, err_)), 0) << attribute;
        return value;
    }

    [[nodiscard]] std::string Message() const {
        OraText text[1024] = {};
        sb4 number = 0;
        OCIErrorGet(err_, 1, nullptr, &number, text, sizeof text, OCI_HTYPE_ERROR);
        return reinterpret_cast<const char*>(text);
    }

    // A pointer that no call handed out: the address of readable bytes that are no object.
    template <class T>
    T* Bogus() {
        return reinterpret_cast<T*>(bogus_);
    }

    OCIEnv* env_ = nullptr;
    OCIError* err_ = nullptr;
    std::string ann_ = "ann";
    std::unique_ptr<PostgresDatabase> server_;    // null for a file

private:
    ub4 mode_;
    std::string folder_;
    alignas(16) char bogus_[16] = "no such object!";
};
