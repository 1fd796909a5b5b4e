// The number and date calls while memory is short: each allocation fails, the n-th alone and all from the n-th on. The
// answer is right, or OCI_ERROR with 1019; the same call answers right afterwards. Each try is a process of its own, as
// much is read or made only once. The sanitizers bring an allocator of their own, so this is not built with them.
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <functional>

#include "support/call_fixture.h"

extern "C" {
void* __libc_malloc(std::size_t size);
void* __libc_calloc(std::size_t count, std::size_t size);
void* __libc_realloc(void* block, std::size_t size);
}

namespace {

// Before the first failing allocation; below 0: none fails.
long until_failure = -1;
bool only_one = false;
bool failed = false;

bool Fails() {
    if (until_failure < 0) return false;
    if (until_failure > 0) return --until_failure, false;
    if (only_one) until_failure = -1;
    return failed = true;
}

}  // namespace

extern "C" {
void* malloc(std::size_t size) { return Fails() ? nullptr : __libc_malloc(size); }
void* calloc(std::size_t count, std::size_t size) { return Fails() ? nullptr : __libc_calloc(count, size); }
void* realloc(void* block, std::size_t size) { return Fails() ? nullptr : __libc_realloc(block, size); }
}

namespace {

struct Case {
    const char* name;
    std::function<sword(char* out)> call;  // writes what it answers, 64 bytes at most
};

enum Outcome { right, refused, not_reached, wrong_code, wrong_value, wrong_record, lost };

class MemoryFails : public CallFixture {
protected:
    // In a process of its own.
    int Try(const Case& c, int n, bool alone) {
        const pid_t child = fork();
        if (child == 0) _exit(Run(c, n, alone));
        int status = 0;
        waitpid(child, &status, 0);
        return WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
    }

    Outcome Run(const Case& c, int n, bool alone) {
        char got[64] = {}, again[64] = {};
        only_one = alone;
        until_failure = n;
        const sword code = c.call(got);
        until_failure = -1;
        sb4 number = 0;
        if (code == OCI_ERROR) OCIErrorGet(err_, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR);
        const sword second = c.call(again);
        if (second != OCI_SUCCESS) return lost;
        if (code == OCI_SUCCESS && std::memcmp(got, again, sizeof got) != 0) return wrong_value;
        if (!failed) return code == OCI_SUCCESS ? not_reached : wrong_code;
        if (code == OCI_SUCCESS) return right;
        if (code != OCI_ERROR) return wrong_code;
        return number == 1019 ? refused : wrong_record;
    }

    void ExpectNoHarm(const std::vector<Case>& cases) {
        for (const Case& c : cases) {
            for (const bool alone : {true, false}) {
                int outcome = right;
                for (int n = 0; n < 500 && outcome != not_reached; ++n) {
                    outcome = Try(c, n, alone);
                    EXPECT_LE(outcome, not_reached) << c.name << ": allocation " << n << (alone ? " alone" : " and all");
                }
                EXPECT_EQ(outcome, not_reached) << c.name;
            }
        }
    }

    OCINumber Number(const char* text) {
        OCINumber number{};
        EXPECT_EQ(OCINumberFromText(err_, Text(text), static_cast<ub4>(std::strlen(text)), nullptr, 0, nullptr, 0,
                                    &number), OCI_SUCCESS) << text;
        return number;
    }

    OCIDateTime* NewDateTime(ub4 type) {
        dvoid* descriptor = nullptr;
        EXPECT_EQ(OCIDescriptorAlloc(env_, &descriptor, type, 0, nullptr), OCI_SUCCESS);
        return static_cast<OCIDateTime*>(descriptor);
    }

    sword Construct(OCIDateTime* to, const char* zone) {
        return OCIDateTimeConstruct(env_, err_, to, 2024, 7, 15, 13, 14, 15, 0, Text(zone), std::strlen(zone));
    }
};

OCINumber* NumberAt(char* out) { return reinterpret_cast<OCINumber*>(out); }

TEST_F(MemoryFails, InFunctionsOfNumbers) {
    const struct {
        const char* name;
        sword (*function)(OCIError*, const OCINumber*, OCINumber*);
    } unary[] = {{"sqrt", OCINumberSqrt},     {"exp", OCINumberExp},       {"ln", OCINumberLn},
                 {"sin", OCINumberSin},       {"cos", OCINumberCos},       {"tan", OCINumberTan},
                 {"arcsin", OCINumberArcSin}, {"arccos", OCINumberArcCos}, {"arctan", OCINumberArcTan},
                 {"sinh", OCINumberHypSin},   {"cosh", OCINumberHypCos},   {"tanh", OCINumberHypTan}};
    const struct {
        const char* name;
        sword (*function)(OCIError*, const OCINumber*, const OCINumber*, OCINumber*);
    } binary[] = {{"add", OCINumberAdd}, {"sub", OCINumberSub},     {"mul", OCINumberMul},        {"div", OCINumberDiv},
                  {"mod", OCINumberMod}, {"power", OCINumberPower}, {"arctan2", OCINumberArcTan2}, {"log", OCINumberLog}};
    const OCINumber value = Number("0.12345678901234567890123456789012345678"), other = Number("7.5");
    std::vector<Case> cases;
    for (const auto& row : unary)
        cases.push_back({row.name, [&, f = row.function](char* out) { return f(err_, &value, NumberAt(out)); }});
    for (const auto& row : binary)
        cases.push_back({row.name, [&, f = row.function](char* out) { return f(err_, &other, &value, NumberAt(out)); }});
    // An argument whose last quarter turn takes 420 bits, a tie that takes all bits, and a result next to a tie.
    const OCINumber huge = Number("9.876E125"), root = Number("3.00000000000000000005"), two = Number("2"),
                    tiny = Number("5E-39");
    cases.push_back({"sine of a huge number", [&](char* out) { return OCINumberSin(err_, &huge, NumberAt(out)); }});
    cases.push_back({"a tie", [&](char* out) { return OCINumberPower(err_, &root, &two, NumberAt(out)); }});
    cases.push_back({"near a tie", [&](char* out) { return OCINumberExp(err_, &tiny, NumberAt(out)); }});
    ExpectNoHarm(cases);
}

TEST_F(MemoryFails, InConversionsOfNumbers) {
    const OCINumber value = Number("1234.5");
    const double real = 0.1;
    const long double wide = 0.1L;
    const auto to_text = [&](char* out, const char* model, const char* nls) {
        ub4 size = 60;
        return OCINumberToText(err_, &value, Text(model), static_cast<ub4>(std::strlen(model)), Text(nls),
                               static_cast<ub4>(std::strlen(nls)), &size, reinterpret_cast<OraText*>(out));
    };
    ExpectNoHarm({{"to text", [&](char* out) { return to_text(out, "", ""); }},
                  {"by a model", [&](char* out) { return to_text(out, "L9G999D99", "NLS_CURRENCY=''abc''"); }},
                  {"roman", [&](char* out) { return to_text(out, "RN", ""); }},
                  {"from text", [&](char* out) {
                       return OCINumberFromText(err_, Text("$1,234.5"), 8, Text("$9,999.9"), 8, nullptr, 0, NumberAt(out));
                   }},
                  {"from double", [&](char* out) { return OCINumberFromReal(err_, &real, 8, NumberAt(out)); }},
                  {"from long double", [&](char* out) { return OCINumberFromReal(err_, &wide, 16, NumberAt(out)); }},
                  {"to double", [&](char* out) { return OCINumberToReal(err_, &value, 8, out); }},
                  {"to long double", [&](char* out) {
                       long double back = 0;
                       const sword code = OCINumberToReal(err_, &value, 16, &back);
                       std::memcpy(out, &back, 10);  // without the bytes that fill it up
                       return code;
                   }}});
}

TEST_F(MemoryFails, InDates) {
    const OCIDate day{2024, 2, 29, {1, 2, 3}};
    const auto to_text = [&](char* out, const char* model, const char* language) {
        ub4 size = 60;
        return OCIDateToText(err_, &day, Text(model), static_cast<ub1>(std::strlen(model)), Text(language),
                             static_cast<ub4>(std::strlen(language)), &size, reinterpret_cast<OraText*>(out));
    };
    const auto from_text = [&](char* out, const char* text, const char* model) {
        return OCIDateFromText(err_, Text(text), static_cast<ub4>(std::strlen(text)), Text(model),
                               static_cast<ub1>(std::strlen(model)), nullptr, 0, reinterpret_cast<OCIDate*>(out));
    };
    ExpectNoHarm({{"to text", [&](char* out) { return to_text(out, "", ""); }},
                  {"long text", [&](char* out) { return to_text(out, "FMDDSPTH MONTH YYYY", "FRENCH"); }},
                  {"from text", [&](char* out) { return from_text(out, "2024-02-29", "YYYY-MM-DD"); }},
                  {"of this century", [&](char* out) { return from_text(out, "29-FEB-24", "DD-MON-RR"); }},
                  {"today", [&](char*) {
                       OCIDate now{};
                       return OCIDateSysDate(err_, &now);
                   }}});
}

// Regions that nothing has read yet, and the zone of the process.
TEST_F(MemoryFails, InDatetimes) {
    OCIDateTime* zoned = NewDateTime(OCI_DTYPE_TIMESTAMP_TZ);
    OCIDateTime* plain = NewDateTime(OCI_DTYPE_TIMESTAMP);
    OCIDateTime* offset = NewDateTime(OCI_DTYPE_TIMESTAMP_TZ);
    OCIDateTime* local = NewDateTime(OCI_DTYPE_TIMESTAMP_LTZ);
    setenv("TZ", ":America/St_Johns", 1);
    ASSERT_EQ(Try({"plain", [&](char*) { return Construct(plain, ""); }}, 0, false), not_reached);
    ASSERT_EQ(Construct(plain, ""), OCI_SUCCESS);
    ASSERT_EQ(Construct(offset, "+05:30"), OCI_SUCCESS);
    const auto compare = [&](char* out, OCIDateTime* left, OCIDateTime* right) {
        return OCIDateTimeCompare(env_, err_, left, right, reinterpret_cast<sword*>(out));
    };
    const Case region{"region", [&](char*) { return Construct(zoned, "Europe/Paris"); }};
    EXPECT_EQ(Try(region, 0, false), refused);
    ExpectNoHarm({region,
                  {"session", [&](char*) { return Construct(zoned, ""); }},
                  {"compare", [&](char* out) { return compare(out, plain, offset); }},
                  {"assign", [&](char*) { return OCIDateTimeAssign(env_, err_, offset, local); }},
                  {"add a zone", [&](char*) { return OCIDateTimeAssign(env_, err_, plain, zoned); }}});
    unsetenv("TZ");
}

}  // namespace
