// Decimal floats into texts: one statement that casts the bound value, run on the server.
#include "objects/decimal_float_query.h"

#include <algorithm>
#include <cstring>

#include "core/state.h"
#include "objects/one_row_query.h"
#include "objects/text_conversion.h"
#include "platform/utf.h"

int DecimalFloatText(int type, const unsigned char* data, uint32_t size, std::string& text) {
    constexpr uint32_t kLongestText = 43;  // of 34 digits, closing zero included
    constexpr uint32_t kShorterText = 24;  // of 16 digits
    unsigned char value[16] = {};
    const uint32_t value_size = type == SQLT_BFLOAT ? 8 : 16;
    std::memcpy(value, data, std::min(size, value_size));
    char result[2 * kLongestText + 2] = {};
    const uint32_t result_size = (type == SQLT_BFLOAT ? kShorterText : kLongestText) * (Utf16Mode ? 2 : 1);

    OneRowQuery query;
    query.Prepare("values( cast( cast(:1 as decfloat(34)) as varchar(100)))");
    query.Bind(value, static_cast<sb4>(value_size), static_cast<ub2>(type));
    query.Define(result, static_cast<sb4>(result_size), SQLT_STR);
    const sword rc = query.Execute();
    if (rc != OCI_SUCCESS) return rc;
    if (Utf16Mode) convertFromUTF16(result, utf::Utf16Length(result, result_size), text);
    else text.assign(result);
    return rc;
}
