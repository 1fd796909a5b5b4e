// The calls on environments, handles, errors, attributes and sessions, as an application makes them: with good
// arguments, with null and foreign pointers, with memory that runs out, in UTF-16, from several threads.
#include <array>
#include <cstdlib>
#include <map>
#include <utility>
#include <vector>

#include "support/at_once.h"
#include "support/call_fixture.h"

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

TEST_F(CallsTest, ArrayDescriptorsShareOneLife) {
    dvoid* array[5] = {};
    dvoid* extra = nullptr;
    ASSERT_EQ(OCIArrayDescriptorAlloc(env_, array, OCI_DTYPE_TIMESTAMP, 5, 64, &extra), OCI_SUCCESS);
    ASSERT_NE(extra, nullptr);
    std::memset(extra, 0xAA, 64);
    EXPECT_EQ(OCIDescriptorFree(array[2], OCI_DTYPE_TIMESTAMP), OCI_SUCCESS);
    EXPECT_EQ(OCIArrayDescriptorFree(array, OCI_DTYPE_LOB), OCI_INVALID_HANDLE);
    EXPECT_EQ(OCIArrayDescriptorFree(array, OCI_DTYPE_TIMESTAMP), OCI_SUCCESS);
    EXPECT_EQ(OCIDescriptorFree(array[4], OCI_DTYPE_TIMESTAMP), OCI_INVALID_HANDLE);
    EXPECT_EQ(OCIArrayDescriptorFree(array, OCI_DTYPE_TIMESTAMP), OCI_INVALID_HANDLE);
    EXPECT_EQ(OCIArrayDescriptorFree(nullptr, OCI_DTYPE_LOB), OCI_INVALID_HANDLE);
    EXPECT_EQ(OCIArrayDescriptorAlloc(env_, array, OCI_DTYPE_LOB, 0, 0, nullptr), OCI_ERROR);
    dvoid* single = nullptr;
    ASSERT_EQ(OCIDescriptorAlloc(env_, &single, OCI_DTYPE_LOB, 0, nullptr), OCI_SUCCESS);
    EXPECT_EQ(OCIArrayDescriptorFree(&single, OCI_DTYPE_LOB), OCI_INVALID_HANDLE) << "not made as an array";
}

TEST_F(CallsTest, UserMemoryComesZeroedAndIsFoundAgain) {
    dvoid* handle = nullptr;
    dvoid* extra = nullptr;
    ASSERT_EQ(OCIHandleAlloc(env_, &handle, OCI_HTYPE_STMT, 100, &extra), OCI_SUCCESS);
    for (int index = 0; index < 100; ++index) ASSERT_EQ(static_cast<char*>(extra)[index], 0);
    std::memset(extra, 1, 100);
    EXPECT_EQ(Attribute<dvoid*>(handle, OCI_HTYPE_STMT, OCI_ATTR_USER_MEMORY), extra);
    ub4 size = 0;
    dvoid* of = nullptr;
    EXPECT_EQ(Answer(OCIAttrGet(handle, OCI_HTYPE_STMT, &of, &size, OCI_ATTR_ENV, err_)), 0);
    EXPECT_TRUE(of == env_ && size == sizeof of) << size;
    EXPECT_EQ(OCIHandleAlloc(env_, &handle, OCI_HTYPE_STMT, SIZE_MAX, &extra), OCI_ERROR) << "more than there is";
    EXPECT_EQ(FirstCode(env_, OCI_HTYPE_ENV), 1019);
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
            OCIServerVersion(server, err, buf, 15, OCI_HTYPE_SERVER)};
        for (std::size_t call = 0; call < std::size(refused); ++call)
            EXPECT_EQ(refused[call], OCI_INVALID_HANDLE) << call;
        EXPECT_EQ(FirstCode(err_), 0) << "no record";
    }
    EXPECT_EQ(OCIEnvCreate(nullptr, 0, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_ERROR);
    EXPECT_EQ(OCIHandleAlloc(env_, nullptr, OCI_HTYPE_STMT, 0, nullptr), OCI_ERROR);
    EXPECT_EQ(FirstCode(env_, OCI_HTYPE_ENV), 21560);
    for (const bool given : {true, false}) {
        EXPECT_EQ(OCIArrayDescriptorAlloc(env_, given ? &out : nullptr, OCI_DTYPE_LOB, given ? 0 : 1, 0, nullptr), OCI_ERROR);
        EXPECT_EQ(FirstCode(env_, OCI_HTYPE_ENV), 21560);
    }
    EXPECT_EQ(OCILogon(env_, err_, nullptr, nullptr, 0, nullptr, 0, nullptr, 0), OCI_ERROR);
    EXPECT_EQ(OCIServerVersion(server, err_, nullptr, 0, OCI_HTYPE_SERVER), OCI_ERROR);
}

// A message beyond what callers have room for is cut to that, and still ends its line.
TEST_F(CallsTest, LongMessagesEndTheirLine) {
    for (const ub4 mode : {ub4{OCI_DEFAULT}, ub4{OCI_UTF16}}) {
        OCIEnv* env = NewEnvironment(mode);
        OCIError* err = NewHandle<OCIError>(env, OCI_HTYPE_ERROR);
        const std::size_t unit = mode == OCI_UTF16 ? 2 : 1;
        ASSERT_EQ(OCIFileInit(env, err), OCI_SUCCESS);
        for (const std::size_t length : {100, 400, 500, 900, 1000, 2000}) {
            std::string name;
            for (std::size_t index = 0; index <= length; ++index) {
                name += index < length ? 'n' : '\0';
                if (unit == 2) name += '\0';
            }
            OCIFileObject* file = nullptr;
            EXPECT_EQ(OCIFileOpen(env, err, &file, reinterpret_cast<OraText*>(name.data()), nullptr,
                                  OCI_FILE_READ_ONLY, OCI_FILE_EXIST, OCI_FILE_BIN), OCI_ERROR);
            std::string text(OCI_ERROR_MAXMSG_SIZE, 'x');
            EXPECT_EQ(OCIErrorGet(err, 1, nullptr, nullptr, reinterpret_cast<OraText*>(text.data()),
                                  OCI_ERROR_MAXMSG_SIZE, OCI_HTYPE_ERROR), OCI_SUCCESS) << mode << ' ' << length;
            std::string line;
            for (std::size_t at = 0; at < text.size() && text[at] != '\0'; at += unit) line += text[at];
            EXPECT_EQ(line.find('\n'), line.size() - 1) << mode << ' ' << length << ": " << line;
            const std::size_t longest = OCI_ERROR_MAXMSG_SIZE / unit - 1;
            EXPECT_EQ(line.size() == longest, length + 40 >= longest) << mode << ' ' << length << ": " << line.size();
        }
        MUST(OCIFileTerm(env, err), OCIHandleFree(env, OCI_HTYPE_ENV));
    }
}

// Databases by their words; the rest of logons stands in transcripts.
TEST_F(CallsTest, LogonsFindTheirDatabase) {
    OCISvcCtx* svc = nullptr;
    std::ofstream(Folder() + "/kelpcli.ini") << "[Remote]\nurl = postgresql:///db?host=/no/such\n";
    for (const char* database : {"postgres:///db?host=/no/such", "remote"}) {
        EXPECT_EQ(LogOn(&svc, database, "ann", "secret"), 12541);
        EXPECT_EQ(svc, nullptr) << "nothing is made by a logon that fails";
    }
    EXPECT_EQ(LogOn(&svc, nullptr, "ann", "secret"), 0) << "the default database";
    EXPECT_TRUE(std::filesystem::exists(Folder() + "/kelp.db"));
    EXPECT_EQ(Answer(OCILogon(env_, err_, &svc, Text("ann"), 4294967295u, Text("secret"), 100, Text("test"), 9000)), 0)
        << "lengths beyond the ends of the texts";
    EXPECT_EQ(Answer(OCILogoff(svc, err_)), 0);
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

// The application's memory functions, which count what is out.
struct OwnMemory {
    int out = 0;

    static dvoid* Allocate(dvoid* context, size_t size) {
        ++static_cast<OwnMemory*>(context)->out;
        auto* block = static_cast<char*>(std::malloc(size + 1));
        std::memset(block, 0x5A, size + 1);
        block[0] = 0;
        return block + 1;    // and aligned to nothing
    }
    static dvoid* Reallocate(dvoid*, dvoid*, size_t) { return nullptr; }
    static void Free(dvoid* context, dvoid* block) {
        --static_cast<OwnMemory*>(context)->out;
        std::free(static_cast<char*>(block) - 1);
    }
};

TEST_F(CallsTest, InitializeServesEnvInit) {
    OwnMemory memory;
    ASSERT_EQ(
        OCIInitialize(OCI_UTF16 | OCI_OBJECT, &memory, OwnMemory::Allocate, OwnMemory::Reallocate, OwnMemory::Free), 0);
    OCIEnv* env = nullptr;
    ASSERT_EQ(OCIEnvInit(&env, OCI_DEFAULT, 0, nullptr), OCI_SUCCESS);
    EXPECT_GT(memory.out, 0);
    dvoid *handle = nullptr, *extra = nullptr;
    ASSERT_EQ(OCIHandleAlloc(env, &handle, OCI_HTYPE_STMT, 9, &extra), OCI_SUCCESS);
    EXPECT_EQ(std::string(static_cast<char*>(extra), 9), std::string(9, '\0'));
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

// Handles come and go in many threads while others are looked up: growth of the set of living objects included.
TEST_F(CallsTest, HandlesFromManyThreads) {
    Reopen(OCI_THREADED);
    AtOnce(8, [&](int number) {
        auto* err = New<OCIError>(OCI_HTYPE_ERROR);
        OCISvcCtx* svc = nullptr;
        const std::string file = Folder() + "/t" + std::to_string(number) + ".db";
        EXPECT_EQ(OCILogon(env_, err, &svc, nullptr, 0, nullptr, 0, Text(file), static_cast<ub4>(file.size())), 0);
        std::vector<dvoid*> handles(600);
        int wrong = 0;
        for (int round = 0; round < 3; ++round) {
            for (dvoid*& handle : handles)
                wrong += OCIHandleAlloc(env_, &handle, OCI_HTYPE_TRANS, 0, nullptr) != OCI_SUCCESS;
            for (dvoid*& handle : handles) wrong += OCIHandleFree(handle, OCI_HTYPE_TRANS) != OCI_SUCCESS;
            for (dvoid*& handle : handles) wrong += OCIHandleAlloc(env_, &handle, 99, 0, nullptr) != OCI_ERROR;
            wrong += OCIPing(svc, err, 0) != OCI_SUCCESS;
        }
        EXPECT_EQ(wrong + OCILogoff(svc, err), 0);
    });
}

}  // namespace
