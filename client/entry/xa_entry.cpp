// The XA switch, its diagnostics, and the bridge from its connections to handles of the call interface.
#include <cstring>
#include <string>

#include "handles/gate.h"
#include "kelpci.h"
#include "oci.h"
#include "platform/utf.h"
#include "xa/branch_calls.h"
#include "xa/resource_manager.h"

namespace {

// The gate of these calls, which have no error handle: what is answered or thrown becomes diagnostics and the code.
template <class Body>
int EnterXa(int rmid, Body body) noexcept {
    const CallInFlight call;
    const LongCall may_take_long;
    try {
        return xa::Note(rmid, body());
    } catch (...) {
        return xa::Note(rmid, {XAER_RMERR, Caught()});
    }
}

template <xa::Answer (*call)(const XID* xid, int rmid, xa_long flags)>
int BranchEntry(XID* xid, int rmid, xa_long flags) {
    return EnterXa(rmid, [&] { return call(xid, rmid, flags); });
}

int OpenEntry(char* info, int rmid, xa_long flags) {
    return EnterXa(rmid, [&] { return xa::Open(rmid, info, flags); });
}

int CloseEntry(char*, int rmid, xa_long flags) {
    return EnterXa(rmid, [&] { return xa::Close(rmid, flags); });
}

int RecoverEntry(XID* xids, xa_long count, int rmid, xa_long flags) {
    const int code = EnterXa(rmid, [&] { return xa::Recover(xids, count, rmid, flags); });
    return code == XA_OK ? static_cast<int>(count) : code;
}

// Nothing is asynchronous here.
int CompleteEntry(int* handle, int* result, int rmid, xa_long) {
    return EnterXa(rmid, [&]() -> xa::Answer { return handle && result ? XAER_PROTO : XAER_INVAL; });
}

// The name in the mode that the process was initialised for, as the environments of connections are.
bool ReadName(const OraText* name, std::string& utf8) {
    if (!name) return true;
    if (!(GetProcessDefaults().mode & OCI_UTF16)) {
        utf8 = reinterpret_cast<const char*>(name);
        return true;
    }
    std::size_t length = 0;
    while (name[length] != 0 || name[length + 1] != 0) length += 2;
    return utf::ToUtf8(name, length, utf8);
}

// What a connection has; null when it, or there, is none.
template <class Handle, class Get>
Handle* HandleOf(const OraText* name, Get get) noexcept try {
    const CallInFlight call;
    std::string utf8;
    if (!ReadName(name, utf8)) return nullptr;
    const xa::ManagerPointer manager = xa::FindManager(std::string_view(utf8));
    return manager ? AsHandle<Handle>(get(*manager)) : nullptr;
} catch (...) {
    return nullptr;
}

}  // namespace

struct xa_switch_t rmXaSwitch = {"KELPCI", TMNOFLAGS, 0, OpenEntry, CloseEntry, BranchEntry<xa::Start>,
                                 BranchEntry<xa::End>, BranchEntry<xa::Rollback>, BranchEntry<xa::Prepare>,
                                 BranchEntry<xa::Commit>, RecoverEntry, BranchEntry<xa::Forget>, CompleteEntry};

OCIEnv* xaoEnv(OraText* dbname) {
    return HandleOf<OCIEnv>(dbname, [](const xa::ResourceManager& manager) { return manager.GetEnvironment(); });
}

OCISvcCtx* xaoSvcCtx(OraText* dbname) {
    return HandleOf<OCISvcCtx>(dbname, [](const xa::ResourceManager& manager) { return manager.GetService(); });
}

int xaosterr(OCISvcCtx* svc, sb4 error) {
    const CallInFlight call;
    return Live<ServiceContext>(svc) ? xa::CodeOf(error) : XAER_INVAL;
}

int XaGetInfo(int rmid, SQLCA* out) {
    return out && xa::Noted(rmid, *out) ? XA_OK : XAER_INVAL;
}
