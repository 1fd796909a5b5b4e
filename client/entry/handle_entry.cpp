// Handles and descriptors: OCIHandleAlloc and its kin. One row a type code says what object is made for it. Any thread
// may free what others work on: a free holds the object's serial lock, and of several frees one succeeds.
#include <algorithm>
#include <span>

#include "date/interval_descriptor.h"
#include "describe/describe_handle.h"
#include "describe/parameter.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "handles/plain_objects.h"
#include "oci.h"
#include "pools/pool_handle.h"
#include "sessions/service_context.h"
#include "statements/result_set.h"
#include "values/lob_descriptor.h"
#include "values/rowid_descriptor.h"

namespace {

template <class T>
Object* Make(Object& parent, TypeCode type, size_t extra) { return Create<T>(parent, type, extra); }

// An environment of its own, alike the one it is asked from.
Object* MakeEnvironment(Object& parent, TypeCode, size_t extra) {
    const Environment& env = parent.Env();
    Environment* environment = Environment::Open(env.Mode(), env.Sets(), env.Memory(), extra);
    if (!environment) throw std::bad_alloc();
    return environment;
}

struct Maker {
    TypeCode type;
    Object* (*make)(Object& parent, TypeCode type, size_t extra);
};

constexpr Maker kHandles[] = {
    {OCI_HTYPE_ENV, MakeEnvironment},
    {OCI_HTYPE_ERROR, Make<ErrorHandle>},
    {OCI_HTYPE_SVCCTX, Make<ServiceContext>},
    {OCI_HTYPE_STMT, Make<Statement>},
    {OCI_HTYPE_BIND, Make<Bind>},
    {OCI_HTYPE_DEFINE, Make<Define>},
    {OCI_HTYPE_DESCRIBE, Make<DescribeHandle>},
    {OCI_HTYPE_SERVER, Make<Server>},
    {OCI_HTYPE_SESSION, Make<Session>},
    {OCI_HTYPE_TRANS, Make<TransactionHandle>},
    {OCI_HTYPE_COMPLEXOBJECT, Make<PlainHandle>},
    {OCI_HTYPE_SECURITY, Make<PlainHandle>},
    {OCI_HTYPE_SUBSCRIPTION, Make<PlainHandle>},
    {OCI_HTYPE_DIRPATH_CTX, Make<PlainHandle>},
    {OCI_HTYPE_DIRPATH_COLUMN_ARRAY, Make<PlainHandle>},
    {OCI_HTYPE_DIRPATH_STREAM, Make<PlainHandle>},
    {OCI_HTYPE_PROC, Make<PlainHandle>},
    {OCI_HTYPE_DIRPATH_FN_CTX, Make<PlainHandle>},
    {OCI_HTYPE_DIRPATH_FN_COL_ARRAY, Make<PlainHandle>},
    {OCI_HTYPE_XADSESSION, Make<PlainHandle>},
    {OCI_HTYPE_XADTABLE, Make<PlainHandle>},
    {OCI_HTYPE_XADFIELD, Make<PlainHandle>},
    {OCI_HTYPE_XADGRANULE, Make<PlainHandle>},
    {OCI_HTYPE_XADRECORD, Make<PlainHandle>},
    {OCI_HTYPE_XADIO, Make<PlainHandle>},
    {OCI_HTYPE_CPOOL, Make<ConnectionPool>},
    {OCI_HTYPE_SPOOL, Make<SessionPool>},
    {OCI_HTYPE_ADMIN, Make<PlainHandle>},
    {OCI_HTYPE_EVENT, Make<PlainHandle>},
};

constexpr Maker kDescriptors[] = {
    {OCI_DTYPE_LOB, Make<LobDescriptor>},
    {OCI_DTYPE_SNAP, Make<Snapshot>},
    {OCI_DTYPE_RSET, Make<ResultSet>},
    {OCI_DTYPE_PARAM, Make<Parameter>},
    {OCI_DTYPE_ROWID, Make<RowIdDescriptor>},
    {OCI_DTYPE_COMPLEXOBJECTCOMP, Make<PlainDescriptor>},
    {OCI_DTYPE_FILE, Make<PlainDescriptor>},
    {OCI_DTYPE_AQENQ_OPTIONS, Make<PlainDescriptor>},
    {OCI_DTYPE_AQDEQ_OPTIONS, Make<PlainDescriptor>},
    {OCI_DTYPE_AQMSG_PROPERTIES, Make<PlainDescriptor>},
    {OCI_DTYPE_AQAGENT, Make<PlainDescriptor>},
    {OCI_DTYPE_LOCATOR, Make<PlainDescriptor>},
    {OCI_DTYPE_INTERVAL_YM, Make<GeneralDescriptor>},    // the general datetime has this number, too
    {OCI_DTYPE_INTERVAL_DS, Make<IntervalDescriptor>},
    {OCI_DTYPE_AQNFY_DESCRIPTOR, Make<PlainDescriptor>},
    {OCI_DTYPE_DATE, Make<DateTimeDescriptor>},
    {OCI_DTYPE_TIME, Make<DateTimeDescriptor>},
    {OCI_DTYPE_TIME_TZ, Make<DateTimeDescriptor>},
    {OCI_DTYPE_TIMESTAMP, Make<DateTimeDescriptor>},
    {OCI_DTYPE_TIMESTAMP_TZ, Make<DateTimeDescriptor>},
    {OCI_DTYPE_TIMESTAMP_LTZ, Make<DateTimeDescriptor>},
    {OCI_DTYPE_UCB, Make<PlainDescriptor>},
    {OCI_DTYPE_SRVDN, Make<PlainDescriptor>},
    {OCI_DTYPE_SIGNATURE, Make<PlainDescriptor>},
    {OCI_DTYPE_RESERVED_1, Make<PlainDescriptor>},
    {OCI_DTYPE_AQLIS_OPTIONS, Make<PlainDescriptor>},
    {OCI_DTYPE_AQLIS_MSG_PROPERTIES, Make<PlainDescriptor>},
    {OCI_DTYPE_CHDES, Make<PlainDescriptor>},
    {OCI_DTYPE_TABLE_CHDES, Make<PlainDescriptor>},
    {OCI_DTYPE_ROW_CHDES, Make<PlainDescriptor>},
    {OCI_DTYPE_CQDES, Make<PlainDescriptor>},
    {OCI_DTYPE_LOB_REGION, Make<PlainDescriptor>},
};

const Maker* Find(std::span<const Maker> makers, TypeCode type) {
    const auto found =
        std::find_if(makers.begin(), makers.end(), [type](const Maker& maker) { return maker.type == type; });
    return found == makers.end() ? nullptr : &*found;
}

Status MakeOne(std::span<const Maker> makers, int unknown_type, Environment& environment, dvoid** out, TypeCode type,
               size_t extra, dvoid** extra_out) {
    if (!out) return Error(errors::kNullArgument);
    const Maker* maker = Find(makers, type);
    if (!maker) return Error(unknown_type);
    Object* object = maker->make(environment, type, extra);
    *out = object;
    if (extra_out) *extra_out = object->UserMemory();
    return {};
}

// The user memory of the whole array belongs to what its descriptors hang below.
Status MakeArray(Environment& environment, dvoid** array, TypeCode type, ub4 count, size_t extra, dvoid** extra_out) {
    if (!array || count == 0) return Error(errors::kNullArgument);
    const Maker* maker = Find(kDescriptors, type);
    if (!maker) return Error(errors::kInvalidObjectType);
    auto* whole = Create<DescriptorArray>(environment, 0, extra);
    try {
        for (ub4 index = 0; index < count; ++index) array[index] = maker->make(*whole, type, 0);
    } catch (...) {
        std::fill_n(array, count, nullptr);
        Destroy(whole);
        throw;
    }
    whole->first = static_cast<const Object*>(array[0]);
    if (extra_out) *extra_out = whole->UserMemory();
    return {};
}

// The living object of this type code, when the table has the code.
Object* Freeable(std::span<const Maker> makers, const void* pointer, TypeCode type) {
    Object* object = Live<Object>(pointer);
    return object && object->Type() == type && Find(makers, type) ? object : nullptr;
}

sword Free(Object& object) noexcept {
    const SerialLock lock(object);
    if (object.InUse())
        return EnterEnvironment(&object.Env(), [](Environment&) { return Error(errors::kHandleInUse); });
    return Destroy(&object) ? OCI_SUCCESS : OCI_INVALID_HANDLE;
}

}  // namespace

sword OCIHandleAlloc(const dvoid* parent, dvoid** out, ub4 type, size_t extra, dvoid** extraOut) {
    return EnterEnvironment(parent, [&](Environment& environment) {
        return MakeOne(kHandles, errors::kIllegalHandleType, environment, out, type, extra, extraOut);
    });
}

sword OCIHandleFree(dvoid* hndl, ub4 type) {
    const CallInFlight call;
    Object* object = Freeable(kHandles, hndl, type);
    return object ? Free(*object) : OCI_INVALID_HANDLE;
}

sword OCIDescriptorAlloc(const dvoid* parent, dvoid** out, ub4 type, size_t extra, dvoid** extraOut) {
    return EnterEnvironment(parent, [&](Environment& environment) {
        return MakeOne(kDescriptors, errors::kInvalidObjectType, environment, out, type, extra, extraOut);
    });
}

sword OCIDescriptorFree(dvoid* desc, ub4 type) {
    const CallInFlight call;
    Object* object = Freeable(kDescriptors, desc, type);
    return object ? Free(*object) : OCI_INVALID_HANDLE;
}

sword OCIArrayDescriptorAlloc(const dvoid* parent, dvoid** array, ub4 type, ub4 count, size_t extra, dvoid** extraOut) {
    return EnterEnvironment(parent, [&](Environment& environment) {
        return MakeArray(environment, array, type, count, extra, extraOut);
    });
}

sword OCIArrayDescriptorFree(dvoid** array, ub4 type) {
    if (!array) return OCI_INVALID_HANDLE;
    const CallInFlight call;
    Object* first = Freeable(kDescriptors, array[0], type);
    auto* whole = first ? Live<DescriptorArray>(first->Parent()) : nullptr;
    return whole && whole->first == first ? Free(*whole) : OCI_INVALID_HANDLE;
}
