// The calls on environments, handles, errors, attributes and sessions, as an application makes them: with good
// arguments, with null and foreign pointers, with memory that runs out, in UTF-16, from several threads.
#include <array>
#include <cstdlib>
#include <map>
#include <utility>
#include <vector>

#include "support/call_fixture.h"
#include "support/own_memory.h"

namespace {

class CallsTest : public CallFixture {
protected:
    void SetUp() override {
        CallFixture::SetUp();
        Folder();
    }
};

TEST_F(CallsTest, EveryTypeIsMadeAndFreedOnce) {
    const struct {
        sword (*alloc)(const dvoid*, dvoid**, ub4, size_t, dvoid**);
        sword (*free)(dvoid*, ub4);
        sword (*other_free)(dvoid*, ub4);
        ub4 first, last;
        sb4 refused;
    } kinds[] = {{OCIHandleAlloc, OCIHandleFree, OCIDescriptorFree, 1, 29, 24316},
                 {OCIDescriptorAlloc, OCIDescriptorFree, OCIHandleFree, 50, 81, 24332}};
    for (const auto& kind : kinds) {
        for (ub4 type = 0; type < 100; ++type) {
            dvoid* made = &type;
            const bool known = type >= kind.first && type <= kind.last;
            ASSERT_EQ(kind.alloc(env_, &made, type, 0, nullptr), known ? OCI_SUCCESS : OCI_ERROR) << type;
            EXPECT_EQ(made == &type, !known) << "the output is written on success only";
            EXPECT_TRUE(known || FirstCode(env_, OCI_HTYPE_ENV) == kind.refused) << type;
            if (!known) continue;
            EXPECT_EQ(kind.free(made, type == kind.last ? kind.first : type + 1), OCI_INVALID_HANDLE) << "another " << type;
            EXPECT_EQ(kind.other_free(made, type), OCI_INVALID_HANDLE) << type;
            EXPECT_EQ(kind.free(made, type), OCI_SUCCESS) << type;
            EXPECT_EQ(kind.free(made, type), OCI_INVALID_HANDLE) << "freed twice " << type;
        }
    }
}

// Whatever is no living handle of the kind: null, text, a handle of another kind, one that is freed.
TEST_F(CallsTest, PointersThatAreNoHandlesAreRefusedUnread) {
    char text[15] = "Invalid buffer";
    dvoid* other = New<dvoid>(OCI_HTYPE_TRANS);
    OCIServer* server = New<OCIServer>(OCI_HTYPE_SERVER);
    dvoid* freed = New<dvoid>(OCI_HTYPE_SVCCTX);
    OCIHandleFree(freed, OCI_HTYPE_SVCCTX);    // last: no other handle lies where it lay
    ub4 number = 0;
    dvoid* out = nullptr;
    for (dvoid* bad :
         {static_cast<dvoid*>(nullptr), static_cast<dvoid*>(text), freed, other, static_cast<dvoid*>(text + 3)}) {
        auto* err = static_cast<OCIError*>(bad);
        auto* svc = static_cast<OCISvcCtx*>(bad);
        auto* buf = reinterpret_cast<OraText*>(text);
        OCISvcCtx* svc_out = nullptr;
        const sword refused[] = {
            OCIHandleAlloc(bad, &out, OCI_HTYPE_STMT, 0, nullptr),
            OCIHandleFree(bad, OCI_HTYPE_STMT),
            OCIDescriptorAlloc(bad, &out, OCI_DTYPE_LOB, 0, nullptr),
            OCIDescriptorFree(bad, OCI_DTYPE_LOB),
            OCIArrayDescriptorAlloc(bad, &out, OCI_DTYPE_LOB, 1, 0, nullptr),
            OCIErrorGet(bad, 1, nullptr, nullptr, buf, 15, OCI_HTYPE_ERROR),
            OCIErrorGet(bad, 1, nullptr, nullptr, buf, 15, 1),
            OCIAttrGet(bad, OCI_HTYPE_SVCCTX, &number, nullptr, OCI_ATTR_ENV, err_),
            OCIAttrSet(bad, OCI_HTYPE_SVCCTX, &number, 0, OCI_ATTR_SERVER, err_),
            OCIAttrGet(server, OCI_HTYPE_SERVER, &number, nullptr, OCI_ATTR_ENV, err),
            OCIAttrSet(server, OCI_HTYPE_SERVER, &number, 0, OCI_ATTR_NONBLOCKING_MODE, err),
            OCILogon(static_cast<OCIEnv*>(bad), err_, &svc_out, nullptr, 0, nullptr, 0, nullptr, 0),
            OCILogon(env_, err, &svc_out, nullptr, 0, nullptr, 0, nullptr, 0),
            OCILogoff(svc, err_),
            OCILogoff(svc, err),
            OCIServerAttach(static_cast<OCIServer*>(bad), err_, nullptr, 0, 0),
            OCIServerAttach(server, err, nullptr, 0, 0),
            OCIServerDetach(static_cast<OCIServer*>(bad), err_, 0),
            OCISessionBegin(svc, err_, static_cast<OCISession*>(bad), 1, 0),
            OCISessionEnd(svc, err_, static_cast<OCISession*>(bad), 0),
            OCIPing(svc, err_, 0),
            OCIBreak(bad, err_),
            OCIReset(bad, err_),
            OCIPasswordChange(svc, err_, buf, 2, buf, 2, buf, 2, 0),
            OCIServerVersion(bad, err_, buf, 15, OCI_HTYPE_SVCCTX),
            OCIServerVersion(other, err_, buf, 15, OCI_HTYPE_TRANS),
            OCIServerVersion(server, err, buf, 15, OCI_HTYPE_SERVER)};
        for (std::size_t call = 0; call < std::size(refused); ++call)
            EXPECT_EQ(refused[call], OCI_INVALID_HANDLE) << call;
        EXPECT_EQ(FirstCode(err_), 0) << "no record";
    }
}

// A password that is too long is found out when the session has begun, which does not stay.
TEST_F(CallsTest, PasswordsThatAreTooLong) {
    OCISvcCtx *svc = nullptr, *other = New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
    auto* server = New<OCIServer>(OCI_HTYPE_SERVER);
    ASSERT_EQ(LogOn(&svc, "test", "zoe", "one"), 0);
    ASSERT_EQ(Answer(OCIServerAttach(server, err_, Text("test"), 4, 0)), 0);
    ASSERT_EQ(Answer(OCIAttrSet(other, OCI_HTYPE_SVCCTX, server, 0, OCI_ATTR_SERVER, err_)), 0);
    const std::string longer(1000, 'x');
    EXPECT_EQ(Answer(OCIPasswordChange(other, err_, Text("zoe"), 3, Text("one"), 3, Text(longer.c_str()), 1000,
                                       OCI_AUTH)), 1017);
    EXPECT_EQ(Answer(OCIPing(other, err_, 0)), 1012);
    EXPECT_EQ(Answer(OCILogoff(svc, err_)), 0);
}

TEST_F(CallsTest, InitializeServesEnvInit) {
    OwnMemory memory;
    ASSERT_EQ(
        OCIInitialize(OCI_UTF16 | OCI_OBJECT, &memory, OwnMemory::Allocate, OwnMemory::Reallocate, OwnMemory::Free), 0);
    OCIEnv* env = nullptr;
    dvoid *handle = nullptr, *extra = nullptr;
    ASSERT_EQ(OCIEnvInit(&env, OCI_DEFAULT, 9, &extra), OCI_SUCCESS);
    EXPECT_GT(memory.out, 0);
    EXPECT_TRUE(extra && Attribute<dvoid*>(env, OCI_HTYPE_ENV, OCI_ATTR_USER_MEMORY) == extra);
    ASSERT_EQ(OCIHandleAlloc(env, &handle, OCI_HTYPE_STMT, 9, &extra), OCI_SUCCESS);
    EXPECT_EQ(std::string(static_cast<char*>(extra), 9), std::string(9, '\0'));
    EXPECT_EQ(Attribute<dvoid*>(handle, OCI_HTYPE_STMT, OCI_ATTR_USER_MEMORY), extra);
    EXPECT_EQ(Attribute<ub1>(env, OCI_HTYPE_ENV, OCI_ATTR_ENV_UTF16), 1);
    EXPECT_EQ(Attribute<ub4>(env, OCI_HTYPE_ENV, OCI_ATTR_OBJECT), 1u);
    EXPECT_EQ(Attribute<ub2>(env, OCI_HTYPE_ENV, OCI_ATTR_CHARSET_ID), 1000);
    ASSERT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
    EXPECT_EQ(memory.out, 0);
    MUST(OCITerminate(OCI_DEFAULT), OCIEnvInit(&env, OCI_DEFAULT, 0, nullptr));
    EXPECT_EQ(Attribute<ub1>(env, OCI_HTYPE_ENV, OCI_ATTR_ENV_UTF16), 0) << "forgotten";
    ASSERT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
    ASSERT_EQ(OCIEnvCreate(&env, 0, &memory, OwnMemory::Allocate, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
    EXPECT_EQ(memory.out, 0) << "one function alone is none";
    ASSERT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
}

// Gives freed blocks out again, the last one first.
struct SameMemory {
    std::map<size_t, std::vector<dvoid*>> freed;
    std::map<dvoid*, size_t> sizes;
    ~SameMemory() {
        for (const auto& [block, size] : sizes) std::free(block);
    }
    static dvoid* Allocate(dvoid* context, size_t size) {
        auto& self = *static_cast<SameMemory*>(context);
        auto& again = self.freed[size];
        dvoid* const block = again.empty() ? std::malloc(size) : again.back();
        if (!again.empty()) again.pop_back();
        self.sizes[block] = size;
        return block;
    }
    static dvoid* Reallocate(dvoid*, dvoid*, size_t) { return nullptr; }
    static void Free(dvoid* context, dvoid* block) {
        auto& self = *static_cast<SameMemory*>(context);
        self.freed[self.sizes[block]].push_back(block);
    }
};

}  // namespace
