// An environment with an error handle, for tests that call the library as an application does.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <string_view>

#include "kelpci.h"
#include "oci.h"

constexpr ub4 kHuge = 0xFFFFFFFF;    // a length that nobody means

class CallFixture : public testing::Test {
protected:
    void SetUp() override { Open(OCI_DEFAULT); }
    void TearDown() override {
        Close();
        EXPECT_EQ(OCI_memGetMemCount(), 0) << "blocks left behind";
    }

    void Open(ub4 mode) {
        ASSERT_EQ(OCIEnvCreate(&env_, mode, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
        dvoid* handle = nullptr;
        ASSERT_EQ(OCIHandleAlloc(env_, &handle, OCI_HTYPE_ERROR, 0, nullptr), OCI_SUCCESS);
        err_ = static_cast<OCIError*>(handle);
    }
    void Close() {
        EXPECT_EQ(OCIHandleFree(env_, OCI_HTYPE_ENV), OCI_SUCCESS);
        env_ = nullptr;
    }
    void Reopen(ub4 mode) {
        Close();
        Open(mode);
    }

    // The record's number after OCI_ERROR; else the return code.
    [[nodiscard]] sb4 Answer(sword code) const {
        sb4 number = 0;
        if (code != OCI_ERROR) return code;
        return OCIErrorGet(err_, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR) == OCI_SUCCESS ? number : code;
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

    static OraText* Text(std::string_view text) {
        return reinterpret_cast<OraText*>(const_cast<char*>(text.data()));
    }
    static OraText* Text(std::u16string_view text) {
        return reinterpret_cast<OraText*>(const_cast<char16_t*>(text.data()));
    }

    OCIEnv* env_ = nullptr;
    OCIError* err_ = nullptr;

private:
    alignas(16) char bogus_[16] = "no such object!";
};
