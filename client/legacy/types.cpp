// Types and lengths of values.
#include "legacy/types.h"

#include <algorithm>
#include <cstring>
#include <limits>

#include "handles/errors.h"
#include "values/conversion.h"

namespace legacy {
namespace {

// What a length of -1 stands for; 0: nothing.
sb4 OwnLength(const dvoid* value, sword type) {
    switch (type) {
        case SQLT_STR: return value ? static_cast<sb4>(std::strlen(static_cast<const char*>(value)) + 1) : 0;
        case SQLT_NUM:
        case SQLT_VNU: return 22;
        case SQLT_RID: return 10;
        case SQLT_DAT: return 7;
        case SQLT_ODT: return sizeof(OCIDate);
        default: return 0;
    }
}

}  // namespace

int CheckType(const dvoid* value, sword type, sb4& length) {
    if (type < 0 || type > std::numeric_limits<ub2>::max()) return errors::kIllegalType;
    const values::ExternalType* found = nullptr;
    std::uint32_t area = 0;
    (void)values::FindType(static_cast<ub2>(type), std::max(length, sb4{0}), true, found, area);
    if (!found || found->is_pointer) return errors::kIllegalType;
    if (length == -1) length = OwnLength(value, type);
    else if (length >= 0) return 0;
    return length > 0 ? 0 : errors::kParameterOutOfRange;
}

}  // namespace legacy
