// Character sets and the names of a language. What has no error handle leaves its record with the environment.
#include <algorithm>
#include <cstring>
#include <string>

#include "date/language.h"
#include "entry/call_text.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "oci.h"

namespace {

// The set of an id; 0 is the environment's.
Status FindSet(const Environment& environment, ub2 id, const CharacterSet*& set) {
    set = id == 0 ? environment.Sets().text : charset::Find(id);
    return set ? Status() : Error(errors::kBadCharacterSet);
}

// A text of one set put into an area as one of another; what does not fit is left out (22059). `unit` is what the sizes
// of the area and of the outcome count.
Status Convert(const CharacterSet& from, const void* source, size_t length, const CharacterSet& to, void* target,
               size_t room, size_t unit, size_t* written) {
    if (!target || (!source && length > 0)) return Error(errors::kNullArgument);
    std::string utf8, text;
    if (!charset::ToUtf8(from, {static_cast<const char*>(source), length}, utf8)) return Error(errors::kBadText);
    if (!charset::FromUtf8(to, utf8, text)) return Error(errors::kBadText);
    const size_t whole = charset::Whole(to, text, std::min(room, text.size() / unit + 1) * unit);
    std::memcpy(target, text.data(), whole);
    if (written) *written = whole / unit;
    return whole == text.size() ? Status() : Error(errors::kBufferTooSmall);
}

// With its closing zero; nothing is written when they do not fit.
Status PutText(const Environment& environment, std::string_view utf8, OraText* buffer, size_t size) {
    if (!buffer) return Error(errors::kNullArgument);
    std::string converted;
    const std::string_view text = TextOut(environment, utf8, converted);
    const size_t zero = environment.Utf16() ? 2 : 1;
    if (size < zero || size - zero < text.size()) return Error(errors::kBufferTooSmall);
    std::memcpy(buffer, text.data(), text.size());
    std::memset(buffer + text.size(), 0, zero);
    return {};
}

struct TextItem {
    ub2 item;
    std::string_view text;
};
constexpr TextItem kTextItems[] = {
    {OCI_NLS_AM, "AM"}, {OCI_NLS_PM, "PM"}, {OCI_NLS_AD, "AD"}, {OCI_NLS_BC, "BC"}, {OCI_NLS_DECIMAL, "."},
    {OCI_NLS_GROUP, ","}, {OCI_NLS_DATEFORMAT, date::kDateModel}, {OCI_NLS_INT_CURRENCY, "AMERICA"},
    {OCI_NLS_LOC_CURRENCY, "$"}, {OCI_NLS_LANGUAGE, "AMERICAN"}, {OCI_NLS_TERRITORY, "AMERICA"},
};

std::string Capitalized(std::string_view name) {
    std::string text(name);
    text.front() = letters::ToUpper(text.front());
    return text;
}

// Empty for an item that is none.
std::string TextOfItem(const Environment& environment, ub2 item) {
    const date::Language& language = date::kEnglish;
    const struct { ub2 first; size_t count; const std::string_view* names; } lists[] = {
        {OCI_NLS_DAYNAME1, 7, language.days.data()}, {OCI_NLS_ABDAYNAME1, 7, language.short_days.data()},
        {OCI_NLS_MONTHNAME1, 12, language.months.data()}, {OCI_NLS_ABMONTHNAME1, 12, language.short_months.data()}};
    for (const auto& list : lists)
        if (item >= list.first && item - list.first < static_cast<int>(list.count))
            return Capitalized(list.names[item - list.first]);
    for (const TextItem& known : kTextItems)
        if (known.item == item) return std::string(known.text);
    return item == OCI_NLS_CHARACTER_SET ? std::string(charset::Name(*environment.Sets().text)) : std::string();
}

}  // namespace

ub2 OCINlsCharSetNameToId(dvoid* env, const OraText* name) {
    const CallInFlight call;
    const Environment* environment = Live<Environment>(env);
    if (!environment || !name) return 0;
    try {
        const TextIn text(*environment, name, TextLength(*environment, name));
        return text.Valid() ? charset::IdOf(text.View()) : ub2{0};
    } catch (const std::bad_alloc&) {
        return 0;
    }
}

sword OCINlsCharSetIdToName(dvoid* env, OraText* buf, size_t buflen, ub2 id) {
    return EnterEnvironment(env, [&](Environment& environment) {
        const CharacterSet* set = nullptr;
        Status found = FindSet(environment, id, set);
        return found.Ok() ? PutText(environment, charset::Name(*set), buf, buflen) : found;
    });
}

sword OCINlsCharSetConvert(dvoid* env, OCIError* err, ub2 dstid, dvoid* dst, size_t dstlen, ub2 srcid, const dvoid* src,
                           size_t srclen, size_t* rsize) {
    return EnterHandle(env, err, [&](Environment& environment) {
        const CharacterSet *from = nullptr, *to = nullptr;
        Status found = FindSet(environment, srcid, from);
        if (found.Ok()) found = FindSet(environment, dstid, to);
        return found.Ok() ? Convert(*from, src, srclen, *to, dst, dstlen, 1, rsize) : found;
    });
}

// What OCIEnvNlsCreate takes for 0: there is no environment here.
sword OCINlsEnvironmentVariableGet(dvoid* value, size_t size, ub2 item, ub2, size_t* rsize) {
    const ub2 id = charset::IdOfLocale();
    if (!value || (size != 0 && size < sizeof id)) return OCI_ERROR;
    if (item != OCI_NLS_CHARSET_ID && item != OCI_NLS_NCHARSET_ID) return OCI_ERROR;
    std::memcpy(value, &id, sizeof id);
    if (rsize) *rsize = sizeof id;
    return OCI_SUCCESS;
}

sword OCINlsGetInfo(dvoid* env, OCIError* err, OraText* buf, size_t buflen, ub2 item) {
    return EnterHandle(env, err, [&](Environment& environment) {
        const std::string text = TextOfItem(environment, item);
        return text.empty() ? Error(errors::kNlsParameter) : PutText(environment, text, buf, buflen);
    });
}

sword OCINlsNumericInfoGet(dvoid* env, OCIError* err, sb4* value, ub2 item) {
    return EnterHandle(env, err, [&](Environment& environment) -> Status {
        if (!value) return Error(errors::kNullArgument);
        const CharacterSet& set = *environment.Sets().text;
        switch (item) {
            case OCI_NLS_CHARSET_MAXBYTESZ: *value = charset::MostBytes(set); return {};
            case OCI_NLS_CHARSET_FIXEDWIDTH: *value = charset::IsFixedWidth(set) ? 1 : 0; return {};
            case OCI_NLS_CHARSET_ID: *value = charset::Id(set); return {};
            case OCI_NLS_NCHARSET_ID: *value = charset::Id(*environment.Sets().national); return {};
            default: return Error(errors::kNlsParameter);
        }
    });
}

sword OCICharSetToUnicode(dvoid* env, ub2* dst, size_t dstlen, const OraText* src, size_t srclen, size_t* rsize) {
    return EnterEnvironment(env, [&](Environment& environment) {
        const CharacterSet& units = *charset::Find(OCI_UTF16ID);
        return Convert(*environment.Sets().text, src, srclen, units, dst, dstlen, sizeof *dst, rsize);
    });
}

sword OCIUnicodeToCharSet(dvoid* env, OraText* dst, size_t dstlen, const ub2* src, size_t srclen, size_t* rsize) {
    return EnterEnvironment(env, [&](Environment& environment) -> Status {
        if (srclen > SIZE_MAX / sizeof *src) return Error(errors::kNullArgument);
        const CharacterSet& units = *charset::Find(OCI_UTF16ID);
        return Convert(units, src, srclen * sizeof *src, *environment.Sets().text, dst, dstlen, 1, rsize);
    });
}
