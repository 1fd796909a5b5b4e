// The query's calls, and the service context to make them over.
#include "objects/one_row_query.h"

#include <cstring>
#include <string>

#include "core/state.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "platform/client_library.h"

namespace {

// A service context made from the default environment, else the first there is.
OCISvcCtx* AnyServiceContext() {
    const NamedObject* any = nullptr;
    for (const NamedObject& slot : SlotsOf(Kind::svc)) {
        if (!slot.in_use) continue;
        if (any == nullptr || (any->parent != DefaultEnvironment && slot.parent == DefaultEnvironment)) any = &slot;
    }
    return any == nullptr ? nullptr : static_cast<OCISvcCtx*>(any->object);
}

// A text as the environment takes its texts.
std::string ForEnvironment(const char* text) {
    if (!Utf16Mode) return text;
    const auto size = static_cast<uint32_t>(std::strlen(text));
    std::string converted(2 * size, '\0');
    uint32_t length = 0;
    convertToUTF16(text, size, converted.data(), 2 * size, &length, true);
    return converted;
}

}  // namespace

OneRowQuery::OneRowQuery() {
    rc_ = Call(&ClientLibrary::OCIHandleAlloc, DefaultEnvironment, reinterpret_cast<dvoid**>(&statement_),
               ub4{OCI_HTYPE_STMT}, size_t{0}, nullptr);
}

OneRowQuery::~OneRowQuery() {
    if (statement_ != nullptr) Call(&ClientLibrary::OCIHandleFree, statement_, ub4{OCI_HTYPE_STMT});
}

void OneRowQuery::Prepare(const char* sql) {
    if (rc_ != OCI_SUCCESS) return;
    const std::string text = ForEnvironment(sql);
    rc_ = Call(&ClientLibrary::OCIStmtPrepare, statement_, DefaultErrorHandle,
               reinterpret_cast<const OraText*>(text.data()), static_cast<ub4>(text.size()), ub4{OCI_NTV_SYNTAX},
               ub4{OCI_DEFAULT});
}

void OneRowQuery::Bind(void* value, sb4 size, ub2 type) {
    if (rc_ != OCI_SUCCESS) return;
    OCIBind* bind = nullptr;
    rc_ = Call(&ClientLibrary::OCIBindByPos, statement_, &bind, DefaultErrorHandle, ub4{1}, value, size, type, nullptr,
               nullptr, nullptr, ub4{0}, nullptr, ub4{OCI_DEFAULT});
}

void OneRowQuery::Define(void* value, sb4 size, ub2 type, sb2* indicator, ub2* length, ub2* code) {
    if (rc_ != OCI_SUCCESS) return;
    OCIDefine* define = nullptr;
    rc_ = Call(&ClientLibrary::OCIDefineByPos, statement_, &define, DefaultErrorHandle, ub4{1}, value, size, type,
               indicator, length, code, ub4{OCI_DEFAULT});
}

sword OneRowQuery::Execute() {
    if (rc_ == OCI_SUCCESS)
        rc_ = Call(&ClientLibrary::OCIStmtExecute, AnyServiceContext(), statement_, DefaultErrorHandle, ub4{1}, ub4{0},
                   nullptr, nullptr, ub4{OCI_DEFAULT});
    return rc_;
}
