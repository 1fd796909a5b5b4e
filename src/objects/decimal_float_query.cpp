// Decimal floats into texts: one statement that casts the bound value, run on the server.
#include "objects/decimal_float_query.h"

#include <algorithm>
#include <cstring>

#include "core/state.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "oci.h"
#include "platform/client_library.h"
#include "platform/utf.h"

namespace {

constexpr char kQuery[] = "values( cast( cast(:1 as decfloat(34)) as varchar(100)))";
constexpr uint32_t kLongestText = 43;   // of 34 digits, closing zero included
constexpr uint32_t kShorterText = 24;   // of 16 digits

// A service context made from the default environment, else the first there is.
OCISvcCtx* AnyServiceContext() {
    const NamedObject* any = nullptr;
    for (const NamedObject& slot : SlotsOf(Kind::svc)) {
        if (!slot.in_use) continue;
        if (any == nullptr || (any->parent != DefaultEnvironment && slot.parent == DefaultEnvironment)) any = &slot;
    }
    return any == nullptr ? nullptr : static_cast<OCISvcCtx*>(any->object);
}

// The query as the environment takes its texts.
struct QueryText {
    char text[2 * sizeof kQuery];
    uint32_t length = sizeof kQuery - 1;

    QueryText() {
        if (Utf16Mode) convertToUTF16(kQuery, sizeof kQuery - 1, text, sizeof text, &length, true);
        else std::memcpy(text, kQuery, sizeof kQuery);
    }
};

}  // namespace

int DecimalFloatText(int type, const unsigned char* data, uint32_t size, std::string& text) {
    OCIStmt* statement = nullptr;
    sword rc = Call(&ClientLibrary::OCIHandleAlloc, DefaultEnvironment, reinterpret_cast<dvoid**>(&statement),
                    ub4{OCI_HTYPE_STMT}, size_t{0}, nullptr);
    if (rc != OCI_SUCCESS) return rc;

    unsigned char value[16] = {};
    const uint32_t value_size = type == SQLT_BFLOAT ? 8 : 16;
    std::memcpy(value, data, std::min(size, value_size));
    char result[2 * kLongestText + 2] = {};
    const uint32_t result_size = (type == SQLT_BFLOAT ? kShorterText : kLongestText) * (Utf16Mode ? 2 : 1);
    OCIBind* bind = nullptr;
    OCIDefine* define = nullptr;
    const QueryText query;

    rc = Call(&ClientLibrary::OCIStmtPrepare, statement, DefaultErrorHandle,
              reinterpret_cast<const OraText*>(query.text), query.length, ub4{OCI_NTV_SYNTAX}, ub4{OCI_DEFAULT});
    if (rc == OCI_SUCCESS)
        rc = Call(&ClientLibrary::OCIBindByPos, statement, &bind, DefaultErrorHandle, ub4{1}, value,
                  static_cast<sb4>(value_size), static_cast<ub2>(type), nullptr, nullptr, nullptr, ub4{0}, nullptr,
                  ub4{OCI_DEFAULT});
    if (rc == OCI_SUCCESS)
        rc = Call(&ClientLibrary::OCIDefineByPos, statement, &define, DefaultErrorHandle, ub4{1}, result,
                  static_cast<sb4>(result_size), ub2{SQLT_STR}, nullptr, nullptr, nullptr, ub4{OCI_DEFAULT});
    if (rc == OCI_SUCCESS)
        rc = Call(&ClientLibrary::OCIStmtExecute, AnyServiceContext(), statement, DefaultErrorHandle, ub4{1}, ub4{0},
                  nullptr, nullptr, ub4{OCI_DEFAULT});
    if (rc == OCI_SUCCESS) {
        if (Utf16Mode) convertFromUTF16(result, utf::Utf16Length(result, result_size), text);
        else text.assign(result);
    }
    Call(&ClientLibrary::OCIHandleFree, statement, ub4{OCI_HTYPE_STMT});
    return rc;
}
