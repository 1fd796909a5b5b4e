// Binds and defines.
#include "entry/call_text.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "statements/statement.h"

namespace {

// The forms of a call differ in the width of sizes and lengths alone.
sword BindByName(OCIStmt* stmt, OCIBind** bind, OCIError* err, const OraText* name, sb4 length,
                 const Statement::BindArguments& arguments, const char* function = __builtin_FUNCTION()) {
    return Enter<Statement>(stmt, err, [&](Statement& statement) {
        if (!name) return Error(errors::kNoSuchBind);
        // A length below 0 asks to measure the name.
        const std::size_t measured = length < 0 ? TextLength(statement.Env(), name) : static_cast<std::size_t>(length);
        const CallText text(statement.Env(), name, measured, false);
        return text.Valid() ? statement.BindByName(bind, text.View(), arguments) : Error(errors::kBadText);
    }, function);
}

sword BindByPosition(OCIStmt* stmt, OCIBind** bind, OCIError* err, ub4 position,
                     const Statement::BindArguments& arguments, const char* function = __builtin_FUNCTION()) {
    return Enter<Statement>(stmt, err, [&](Statement& statement) {
        return statement.BindByPosition(bind, position, arguments);
    }, function);
}

sword DefineByPosition(OCIStmt* stmt, OCIDefine** def, OCIError* err, ub4 position, const AreaArguments& arguments,
                       ub4 mode, const char* function = __builtin_FUNCTION()) {
    return Enter<Statement>(stmt, err, [&](Statement& statement) {
        return statement.DefineByPosition(def, position, arguments, mode);
    }, function);
}

// Steps of an array of structures, for a bind or a define.
template <class Handle>
sword SetSteps(const void* object, OCIError* err, ub4 value, ub4 indicator, ub4 length, ub4 code,
               const char* name = __builtin_FUNCTION()) {
    return Enter<Handle>(object, err, [&](Handle& handle) {
        handle.area->SetSteps(value, indicator, length, code);
        return Status();
    }, name);
}

}  // namespace

sword OCIBindByName(OCIStmt* stmt, OCIBind** bind, OCIError* err, const OraText* name, sb4 nameLen, dvoid* value,
                    sb4 valueSize, ub2 type, dvoid* ind, ub2* alen, ub2* rcode, ub4 maxArrayLen, ub4* curElements,
                    ub4 mode) {
    return BindByName(stmt, bind, err, name, nameLen,
                      {{value, valueSize, type, ind, alen, rcode}, maxArrayLen, curElements, mode});
}

sword OCIBindByPos(OCIStmt* stmt, OCIBind** bind, OCIError* err, ub4 pos, dvoid* value, sb4 valueSize, ub2 type,
                   dvoid* ind, ub2* alen, ub2* rcode, ub4 maxArrayLen, ub4* curElements, ub4 mode) {
    return BindByPosition(stmt, bind, err, pos,
                          {{value, valueSize, type, ind, alen, rcode}, maxArrayLen, curElements, mode});
}

sword OCIDefineByPos(OCIStmt* stmt, OCIDefine** def, OCIError* err, ub4 pos, dvoid* value, sb4 valueSize, ub2 type,
                     dvoid* ind, ub2* rlen, ub2* rcode, ub4 mode) {
    return DefineByPosition(stmt, def, err, pos, {value, valueSize, type, ind, rlen, rcode}, mode);
}

sword OCIBindByName2(OCIStmt* stmt, OCIBind** bind, OCIError* err, const OraText* name, sb4 nameLen, dvoid* value,
                    sb8 valueSize, ub2 type, dvoid* ind, ub4* alen, ub2* rcode, ub4 maxArrayLen, ub4* curElements,
                    ub4 mode) {
    return BindByName(stmt, bind, err, name, nameLen,
                      {{value, valueSize, type, ind, alen, rcode}, maxArrayLen, curElements, mode});
}

sword OCIBindByPos2(OCIStmt* stmt, OCIBind** bind, OCIError* err, ub4 pos, dvoid* value, sb8 valueSize, ub2 type,
                   dvoid* ind, ub4* alen, ub2* rcode, ub4 maxArrayLen, ub4* curElements, ub4 mode) {
    return BindByPosition(stmt, bind, err, pos,
                          {{value, valueSize, type, ind, alen, rcode}, maxArrayLen, curElements, mode});
}

sword OCIDefineByPos2(OCIStmt* stmt, OCIDefine** def, OCIError* err, ub4 pos, dvoid* value, sb8 valueSize, ub2 type,
                     dvoid* ind, ub4* rlen, ub2* rcode, ub4 mode) {
    return DefineByPosition(stmt, def, err, pos, {value, valueSize, type, ind, rlen, rcode}, mode);
}

sword OCIBindDynamic(OCIBind* b, OCIError* err, dvoid* inCtx, OCICallbackInBind in, dvoid* outCtx,
                     OCICallbackOutBind out) {
    return Enter<Bind>(b, err, [&](Bind& bind) { return bind.area->SetCallbacks({in, inCtx, out, nullptr, outCtx}); });
}

sword OCIDefineDynamic(OCIDefine* d, OCIError* err, dvoid* ctx, OCICallbackDefine cb) {
    return Enter<Define>(d, err, [&](Define& define) {
        return define.area->SetCallbacks({nullptr, nullptr, nullptr, cb, ctx});
    });
}

sword OCIBindArrayOfStruct(OCIBind* b, OCIError* err, ub4 valueSkip, ub4 indSkip, ub4 lenSkip, ub4 rcodeSkip) {
    return SetSteps<Bind>(b, err, valueSkip, indSkip, lenSkip, rcodeSkip);
}

sword OCIDefineArrayOfStruct(OCIDefine* d, OCIError* err, ub4 valueSkip, ub4 indSkip, ub4 lenSkip, ub4 rcodeSkip) {
    return SetSteps<Define>(d, err, valueSkip, indSkip, lenSkip, rcodeSkip);
}
