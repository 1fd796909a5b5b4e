// Calls with pointers that are no handles, and with a handle where another one was.
#include <array>
#include <cstdlib>
#include <map>
#include <utility>
#include <vector>

#include "oci_legacy.h"
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
        OCIString* copy = nullptr;
        OCIRaw* raw = nullptr;
        Lda_Def login{};
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
            OCIServerVersion(server, err, buf, 15, OCI_HTYPE_SERVER),
            OCISessionGet(env_, err, &svc_out, nullptr, buf, 1, nullptr, 0, nullptr, nullptr, nullptr, 0),
            OCISessionGet(env_, err_, &svc_out, static_cast<OCIAuthInfo*>(bad ? bad : other), buf, 1, nullptr, 0,
                          nullptr, nullptr, nullptr, 0),
            OCISessionRelease(svc, err_, nullptr, 0, 0),
            OCISessionPoolDestroy(static_cast<OCISPool*>(bad), err_, 0),
            OCIConnectionPoolDestroy(static_cast<OCICPool*>(bad), err_, 0),
            OCITransStart(svc, err_, 0, OCI_TRANS_NEW),
            OCITransMultiPrepare(svc, 1, reinterpret_cast<OCITrans**>(&other), &err_),
            OCIDescribeAny(svc, err_, buf, 1, OCI_OTYPE_NAME, 0, OCI_PTYPE_TABLE, static_cast<OCIDescribe*>(bad)),
            OCIParamGet(bad, OCI_DTYPE_PARAM, err_, &out, 1),
            OCISvcCtxToLda(svc, err_, &login),
            OCIStringAssign(env_, err_, static_cast<OCIString*>(bad ? bad : other), &copy),
            OCIRawAssignRaw(env_, err_, static_cast<OCIRaw*>(bad ? bad : other), &raw)};
        for (std::size_t call = 0; call < std::size(refused); ++call)
            EXPECT_EQ(refused[call], OCI_INVALID_HANDLE) << call;
        EXPECT_EQ(FirstCode(err_), 0) << "no record";
    }
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

// What a context was put together from is not what lies there later.
TEST_F(CallsTest, AHandleWhereAnotherOneWas) {
    SameMemory memory;
    OCIEnv* env = nullptr;
    ASSERT_EQ(OCIEnvCreate(&env, 0, &memory, SameMemory::Allocate, SameMemory::Reallocate, SameMemory::Free, 0, nullptr), 0);
    dvoid* service = nullptr;
    ASSERT_EQ(OCIHandleAlloc(env, &service, OCI_HTYPE_SVCCTX, 0, nullptr), 0);
    constexpr std::array<std::pair<ub4, ub4>, 3> parts{{{OCI_HTYPE_SERVER, OCI_ATTR_SERVER}, {OCI_HTYPE_SESSION, OCI_ATTR_SESSION},
                                                        {OCI_HTYPE_TRANS, OCI_ATTR_TRANS}}};
    for (const auto& [type, attribute] : parts) {
        dvoid *former = nullptr, *next = nullptr;
        ASSERT_EQ(OCIHandleAlloc(env, &former, type, 0, nullptr), 0);
        ASSERT_EQ(OCIAttrSet(service, OCI_HTYPE_SVCCTX, former, 0, attribute, err_), 0);
        EXPECT_EQ(Attribute<dvoid*>(service, OCI_HTYPE_SVCCTX, attribute), former);
        ASSERT_EQ(OCIHandleFree(former, type) + OCIHandleAlloc(env, &next, type, 0, nullptr), 0);
        ASSERT_EQ(next, former) << "else this test tests nothing";
        EXPECT_EQ(Attribute<dvoid*>(service, OCI_HTYPE_SVCCTX, attribute), nullptr) << type;
    }
    ASSERT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), 0);
}

}  // namespace
