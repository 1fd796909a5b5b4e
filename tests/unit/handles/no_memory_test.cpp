// Calls while the C++ heap has nothing to give: threads that meet the library then, handles that are freed then, errors
// that are to be recorded then. The library's operator new is this program's. The first test is meant to be the first
// in its process, as it is when the suite runs each in one of its own.
#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <new>
#include <string>
#include <thread>
#include <vector>

#include "kelpci.h"
#include "oci.h"

namespace {

thread_local int allowed = -1;    // allocations of this thread that still succeed; -1: all

void* Allocate(std::size_t size, std::size_t alignment) {
    if (allowed == 0) return nullptr;
    if (allowed > 0) --allowed;
    return std::aligned_alloc(alignment, (size + alignment) / alignment * alignment);
}

void* Need(void* memory) {
    if (!memory) throw std::bad_alloc();
    return memory;
}

constexpr std::size_t kPlain = alignof(std::max_align_t);

}  // namespace

void* operator new(std::size_t size) { return Need(Allocate(size, kPlain)); }
void* operator new(std::size_t size, const std::nothrow_t&) noexcept { return Allocate(size, kPlain); }
void* operator new(std::size_t size, std::align_val_t to) { return Need(Allocate(size, std::size_t(to))); }
void* operator new(std::size_t size, std::align_val_t to, const std::nothrow_t&) noexcept {
    return Allocate(size, std::size_t(to));
}
void operator delete(void* memory) noexcept { std::free(memory); }
void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }
void operator delete(void* memory, std::align_val_t) noexcept { std::free(memory); }
void operator delete(void* memory, std::size_t, std::align_val_t) noexcept { std::free(memory); }

namespace {

const OraText* Text(const char* text) { return reinterpret_cast<const OraText*>(text); }

template <class T>
T* New(OCIEnv* env, ub4 type) {
    dvoid* made = nullptr;
    EXPECT_EQ(OCIHandleAlloc(env, &made, type, 0, nullptr), OCI_SUCCESS);
    return static_cast<T*>(made);
}

OCIEnv* NewEnvironment() {
    OCIEnv* env = nullptr;
    EXPECT_EQ(OCIEnvCreate(&env, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
    return env;
}

TEST(NoMemory, FirstFreeOfTheProcess) {
    OCIEnv* env = NewEnvironment();
    dvoid* stmt = New<dvoid>(env, OCI_HTYPE_STMT);
    allowed = 0;
    const sword freed = OCIHandleFree(stmt, OCI_HTYPE_STMT);
    const sword again = OCIHandleFree(stmt, OCI_HTYPE_STMT);
    const sword whole = OCIHandleFree(env, OCI_HTYPE_ENV);
    allowed = -1;
    EXPECT_EQ(freed, OCI_SUCCESS);
    EXPECT_EQ(again, OCI_INVALID_HANDLE);
    EXPECT_EQ(whole, OCI_SUCCESS);
    EXPECT_EQ(OCI_memGetMemCount(), 0);
}

// Threads whose first calls, and all further ones, find no memory: they look handles up and free them as others do.
TEST(NoMemory, ThreadsThatNeverHadAny) {
    OCIEnv* env = NewEnvironment();
    auto* stmt = New<OCIStmt>(env, OCI_HTYPE_STMT);
    constexpr int kThreads = 4, kHandles = 300;
    std::vector<std::vector<dvoid*>> handles(kThreads, std::vector<dvoid*>(kHandles));
    std::vector<OCIError*> errors;
    for (auto& row : handles) {
        errors.push_back(New<OCIError>(env, OCI_HTYPE_ERROR));
        for (dvoid*& handle : row) handle = New<dvoid>(env, OCI_HTYPE_TRANS);
    }
    const sb4 before = OCI_memGetMemCount();
    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    for (int index = 0; index < kThreads; ++index) {
        threads.emplace_back([&, index] {
            allowed = 0;
            for (dvoid* handle : handles[index]) {
                ub4 rows = 0;
                wrong += OCIAttrGet(stmt, OCI_HTYPE_STMT, &rows, nullptr, OCI_ATTR_PREFETCH_ROWS, errors[index]) != 0;
                wrong += OCIHandleFree(handle, OCI_HTYPE_TRANS) != OCI_SUCCESS || rows != 1;
                wrong += OCIHandleFree(handle, OCI_HTYPE_TRANS) != OCI_INVALID_HANDLE;
            }
            OCINumber number{};
            wrong += OCINumberFromInt(errors[index], &index, sizeof index, OCI_NUMBER_SIGNED, &number) != OCI_SUCCESS;
            allowed = -1;
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(OCI_memGetMemCount(), before - kThreads * kHandles);
    EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
    EXPECT_EQ(OCI_memGetMemCount(), 0);
}

// An error with words of its own, with one allocation more each time: there is always a record.
TEST(NoMemory, EveryErrorLeavesARecord) {
    OCIEnv* env = NewEnvironment();
    auto* err = New<OCIError>(env, OCI_HTYPE_ERROR);
    ASSERT_EQ(OCIFileInit(env, err), OCI_SUCCESS);
    const std::string name = "/no/such/folder/and/a/name/that/is/longer/than/a/short/string";
    bool whole = false;
    for (int count = 0; !whole; ++count) {
        ASSERT_LT(count, 50);
        OCIFileObject* file = nullptr;
        allowed = count;
        const sword rc = OCIFileOpen(env, err, &file, const_cast<OraText*>(Text(name.c_str())), nullptr,
                                     OCI_FILE_READ_ONLY, OCI_FILE_EXIST, OCI_FILE_BIN);
        whole = allowed > 0;
        allowed = -1;
        sb4 code = 0;
        OraText text[500] = "";
        EXPECT_EQ(rc, OCI_ERROR) << count;
        EXPECT_EQ(OCIErrorGet(err, 1, nullptr, &code, text, sizeof text, OCI_HTYPE_ERROR), OCI_SUCCESS) << count;
        EXPECT_TRUE(code == 1019 || code == 30152) << count << ": " << code;
        EXPECT_EQ(OCIErrorGet(err, 2, nullptr, &code, nullptr, 0, OCI_HTYPE_ERROR), OCI_NO_DATA) << count;
        if (whole) {
            EXPECT_NE(std::string(reinterpret_cast<char*>(text)).find(name), std::string::npos) << text;
        }
    }
    ASSERT_EQ(OCIFileTerm(env, err), OCI_SUCCESS);
    EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
    EXPECT_EQ(OCI_memGetMemCount(), 0);
}

// Threads and keys, each allocation failing in turn: what is refused is told, and nothing hangs or is left behind.
TEST(NoMemory, ThreadPackage) {
    OCIEnv* env = NewEnvironment();
    auto* err = New<OCIError>(env, OCI_HTYPE_ERROR);
    ASSERT_EQ(OCIThreadInit(env, err), OCI_SUCCESS);
    OCIThreadKey* key = nullptr;
    OCIThreadHandle* handle = nullptr;
    ASSERT_EQ(OCIThreadKeyInit(env, err, &key, nullptr), OCI_SUCCESS);
    ASSERT_EQ(OCIThreadHndInit(env, err, &handle), OCI_SUCCESS);
    std::thread([&] {
        sword rc = OCI_ERROR;
        for (int count = 0; rc != OCI_SUCCESS; ++count) {
            ASSERT_LT(count, 50);
            allowed = count;
            rc = OCIThreadKeySet(env, err, key, &key);
            allowed = -1;
            EXPECT_TRUE(rc == OCI_SUCCESS || rc == OCI_ERROR) << count;
        }
        dvoid* value = nullptr;
        EXPECT_EQ(OCIThreadKeyGet(env, err, key, &value), OCI_SUCCESS);
        EXPECT_EQ(value, &key);
    }).join();
    sword rc = OCI_ERROR;
    for (int count = 0; rc != OCI_SUCCESS; ++count) {
        ASSERT_LT(count, 50);
        allowed = count;
        rc = OCIThreadCreate(env, err, [](dvoid*) {}, nullptr, nullptr, handle);
        allowed = -1;
        if (rc != OCI_SUCCESS) {
            EXPECT_EQ(OCIThreadJoin(env, err, handle), OCI_ERROR) << count << ": there is no thread";
        }
    }
    EXPECT_EQ(OCIThreadJoin(env, err, handle), OCI_SUCCESS);
    ASSERT_EQ(OCIThreadTerm(env, err), OCI_SUCCESS);
    EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
    EXPECT_EQ(OCI_memGetMemCount(), 0);
}

}  // namespace
