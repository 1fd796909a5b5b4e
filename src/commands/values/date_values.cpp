// Dates between words, buffers and the log.
#include "commands/values/date_values.h"

#include <cstring>

#include "objects/buffers.h"
#include "objects/element_access.h"

namespace {

constexpr uint16_t kDateLength = sizeof(OCIDate);

// Null, after a complaint, unless the word names a buffer of dates.
MemBuffer* FindDateBuffer(const char* word) {
    MemBuffer* const buffer = FindBuffer(word);
    if (buffer == nullptr || (buffer->type == SQLT_ODT && buffer->data != nullptr)) return buffer;
    Message(kError, "Buffer %s is not of type SQLT_ODT\n", word);
    return nullptr;
}

OCIDate DateOf(const SevenByteDate& fields) {
    const OCITime time = {static_cast<ub1>(fields.hour), static_cast<ub1>(fields.minute),
                          static_cast<ub1>(fields.second)};
    return {static_cast<sb2>(fields.year), static_cast<ub1>(fields.month), static_cast<ub1>(fields.day), time};
}

struct CheckFlag {
    uword bit;
    const char* line;
};
constexpr CheckFlag kCheckFlags[] = {
    {OCI_DATE_INVALID_DAY, "    OCI_DATE_INVALID_DAY\n"},
    {OCI_DATE_DAY_BELOW_VALID, "    OCI_DATE_DAY_BELOW_VALID\n"},
    {OCI_DATE_INVALID_MONTH, "    OCI_DATE_INVALID_MONTH\n"},
    {OCI_DATE_MONTH_BELOW_VALID, "    OCI_DATE_MONTH_BELOW_VALID\n"},
    {OCI_DATE_INVALID_YEAR, "    OCI_DATE_INVALID_YEAR\n"},
    {OCI_DATE_YEAR_BELOW_VALID, "    OCI_DATE_YEAR_BELOW_VALID\n"},
    {OCI_DATE_INVALID_HOUR, "    OCI_DATE_INVALID_HOUR\n"},
    {OCI_DATE_HOUR_BELOW_VALID, "    OCI_DATE_HOUR_BELOW_VALID\n"},
    {OCI_DATE_INVALID_MINUTE, "    OCI_DATE_INVALID_MINUTE\n"},
    {OCI_DATE_MINUTE_BELOW_VALID, "    OCI_DATE_MINUTE_BELOW_VALID\n"},
    {OCI_DATE_INVALID_SECOND, "    OCI_DATE_INVALID_SECOND\n"},
    {OCI_DATE_SECOND_BELOW_VALID, "    OCI_DATE_SECOND_BELOW_VALID\n"},
    {OCI_DATE_DAY_MISSING_FROM_1582, "    OCI_DATE_DAY_MISSING_FROM_1582\n"},
    {OCI_DATE_YEAR_ZERO, "    OCI_DATE_YEAR_ZERO\n"},
    {OCI_DATE_INVALID_FORMAT, "    OCI_DATE_INVALID_FORMAT\n"},
};

}  // namespace

bool DateOperand::Resolve(const char* word, ErrorWord&) {
    if (IsNull(word)) return true;
    SevenByteDate fields;
    if (ReadDateLiteral(word, fields)) {
        value_ = DateOf(fields);
    } else {
        const MemBuffer* const buffer = FindDateBuffer(word);
        if (buffer == nullptr) return false;
        std::memcpy(&value_, buffer->data, sizeof value_);
    }
    pointer_ = &value_;
    return true;
}

void StoreDate(const char* word, const OCIDate& date) {
    MemBuffer* const buffer = FindDateBuffer(word);
    if (buffer == nullptr) return;
    std::memcpy(buffer->data, &date, sizeof date);
    if (buffer->lengths != nullptr) buffer->lengths[0] = kDateLength;
}

void PrintDateCheckFlags(uword flags) {
    for (const CheckFlag& flag : kCheckFlags)
        if ((flags & flag.bit) != 0) MessageText(kOutput, flag.line);
}
