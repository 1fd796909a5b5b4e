// OCIDescribeAny: an object of the database, by its name.
#include <optional>
#include <string>

#include "describe/describe_handle.h"
#include "entry/call_text.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "sessions/service_context.h"

namespace {

struct Describable {
    ub1 type;
    std::optional<engine::ObjectKind> kind;    // nothing: no engine has objects of the type
};
constexpr Describable kDescribable[] = {
    {OCI_PTYPE_UNK, engine::ObjectKind::any},          {OCI_PTYPE_TABLE, engine::ObjectKind::table},
    {OCI_PTYPE_VIEW, engine::ObjectKind::view},        {OCI_PTYPE_SEQ, engine::ObjectKind::sequence},
    {OCI_PTYPE_SYN, engine::ObjectKind::synonym},      {OCI_PTYPE_SCHEMA, engine::ObjectKind::schema},
    {OCI_PTYPE_DATABASE, engine::ObjectKind::database},
    {OCI_PTYPE_PROC, {}},                              {OCI_PTYPE_FUNC, {}},
    {OCI_PTYPE_PKG, {}},                               {OCI_PTYPE_TYPE, {}},
};

// What the call gives besides the handles: by reference or by pointer only types could be described.
Status CheckArguments(const void* name, ub1 pointer_type, ub1 level, ub1 type, const Describable*& found) {
    if (pointer_type == OCI_OTYPE_REF || pointer_type == OCI_OTYPE_PTR) return Error(errors::kNotDescribable);
    if (pointer_type != OCI_OTYPE_NAME || !name) return Error(errors::kNullArgument);
    if (level != OCI_DEFAULT) return Error(errors::kBadMode);
    for (const Describable& row : kDescribable) {
        if (row.type == type) found = &row;
    }
    return found ? Status() : Error(errors::kNotDescribable);
}

Status Describe(ServiceContext& service, std::string_view name, const Describable& wanted,
                std::shared_ptr<const describe::Node>& root) {
    const SessionTurn turn(service);
    if (turn.status.Failed()) return turn.status;
    if (!wanted.kind) return Error(errors::kNoSuchObject);
    engine::ObjectDescription object;
    Status status = turn.link->Engine().Describe(name, *wanted.kind, object);
    if (status.Failed()) return status;
    describe::DatabaseFacts facts;
    if (object.kind == engine::ObjectKind::database)
        facts = {turn.link->Database().Version(), !turn.link->Database().GetDialect().cuts_for_update};
    root = describe::DescribedObject(std::move(object), std::move(facts));
    return status;
}

}  // namespace

sword OCIDescribeAny(OCISvcCtx* svc, OCIError* err, dvoid* object, ub4 objectLen, ub1 pointerType, ub1 infoLevel,
                     ub1 objectType, OCIDescribe* dsc) {
    return EnterUnlocked<ServiceContext>(svc, err, [&](ServiceContext& service) -> Status {
        auto* handle = Live<DescribeHandle>(dsc);
        if (!handle) return InvalidHandle();
        const Describable* wanted = nullptr;
        std::shared_ptr<const describe::Node> root;
        Status status = CheckArguments(object, pointerType, infoLevel, objectType, wanted);
        if (status.Ok()) {
            const CallText name(service.Env(), static_cast<const OraText*>(object), objectLen, false);
            const LongCall may_take_long;
            status = name.Valid() ? Describe(service, name.View(), *wanted, root) : Error(errors::kBadText);
        }
        const SerialLock lock(*handle);
        handle->Show(std::move(root));    // nothing, when it failed
        return status;
    });
}
