// Character sets of environments, binds and defines, and the calls on sets and settings. The bytes of the texts are
// another program's.
#include "support/call_fixture.h"
#include "support/statement_fixture.h"

namespace {

struct NlsCalls : CallFixture {
    void Nls(ub2 set, ub2 national = 0, ub4 mode = OCI_DEFAULT) {
        Close();
        EXPECT_EQ(OCIEnvNlsCreate(&env_, mode, nullptr, nullptr, nullptr, nullptr, 0, nullptr, set, national),
                  OCI_SUCCESS) << set;
        err_ = New<OCIError>(OCI_HTYPE_ERROR);
    }
};

// From a set to another, into so much room: the text, or the number of what it is refused with and how far it came.
TEST_F(NlsCalls, TextsAreConverted) {
    const auto convert = [&](ub2 to, ub2 from, std::string_view text, size_t room = 20) {
        char area[20] = "";
        size_t length = 0;
        const sword code = OCINlsCharSetConvert(env_, err_, to, area, room, from, text.data(), text.size(), &length);
        return std::pair(Answer(code), std::string(area, length));
    };
    const struct { ub2 set; std::string_view text, utf8; } cases[] = {
        {178, "Z\xfcr\x80", "Zür€"}, {171, "\xc4\xe0", "Да"}, {46, "\xa4\xe9", "€é"}, {170, "\xa3\x9f", "Łź"},
        {31, "\x80\xe9", "\u0080é"}, {1, "az~", "az~"}, {2000, {"\0\xe9\xd8=\xde\0", 6}, "é😀"}, {871, "é", "é"}};
    for (const ub2 own : {873, 1000}) {    // the environment's has no say
        Nls(own);
        for (const auto& c : cases) {
            EXPECT_EQ(convert(873, c.set, c.text), std::pair(0, std::string(c.utf8))) << c.set;
            EXPECT_EQ(convert(c.set, 873, c.utf8), std::pair(0, std::string(c.text))) << c.set;
        }
    }
    Nls(873);
    const struct { ub2 to, from; std::string_view text; size_t room; sb4 answer; std::string result; } edges[] = {
        {31, 873, "€😁é", 9, 0, "??\xe9"}, {1, 873, "é", 9, 0, "?"}, {873, 1, "\x80", 9, 24501, ""},
        {873, 178, "\x81", 9, 24501, ""}, {31, 873, "\xc3", 9, 24501, ""}, {873, 31, "a\xe9", 2, 22059, "a"},
        {2000, 873, "\U0010FFFF", 3, 22059, ""}, {7, 873, "a", 9, 24329, ""}, {873, 873, "ab", 0, 22059, ""},
        {2000, 873, "longer than one", 1, 22059, ""}, {31, 873, {}, 8, 0, ""}, {873, 7, "a", 9, 24329, ""}, {0, 31, "\xe9", 9, 0, "é"}};
    for (const auto& c : edges) EXPECT_EQ(convert(c.to, c.from, c.text, c.room), std::pair(c.answer, c.result)) << c.text;
    ub2 units[4] = {};
    char bytes[8] = "";
    size_t length = 0;
    Nls(178);
    EXPECT_EQ(OCICharSetToUnicode(env_, units, 4, Text("a\x80"), 2, &length), OCI_SUCCESS);
    EXPECT_EQ(units[1] * 10 + length, 0x20ACu * 10 + 2);
    EXPECT_EQ(OCIUnicodeToCharSet(env_, Text(bytes), 8, units, 2, &length), OCI_SUCCESS);
    EXPECT_EQ(std::string_view(bytes, length), "a\x80");
    EXPECT_EQ(OCICharSetToUnicode(env_, units, 1, Text("ab"), 2, &length), OCI_ERROR);
    EXPECT_EQ(FirstCode(env_, OCI_HTYPE_ENV) + static_cast<sb4>(length), 22060);
}

TEST_F(NlsCalls, NamesAndSettings) {
    sb4 fixed = 9;
    EXPECT_EQ(Answer(OCINlsNumericInfoGet(env_, err_, &fixed, OCI_NLS_CHARSET_FIXEDWIDTH)), 0);
    EXPECT_EQ(fixed, 0);
    Nls(178, 1000);
    const struct { ub2 id; const char* name; } sets[] = {
        {1, "US7ASCII"}, {31, "WE8ISO8859P1"}, {46, "WE8ISO8859P15"}, {170, "EE8MSWIN1250"}, {171, "CL8MSWIN1251"},
        {178, "WE8MSWIN1252"}, {871, "UTF8"}, {873, "AL32UTF8"}, {2000, "AL16UTF16"}};
    char text[OCI_NLS_MAXBUFSZ];
    for (const auto& c : sets) {
        EXPECT_EQ(OCINlsCharSetNameToId(env_, Text(c.name)), c.id);
        EXPECT_EQ(OCINlsCharSetIdToName(env_, Text(text), sizeof text, c.id), OCI_SUCCESS);
        EXPECT_STREQ(text, c.name);
    }
    EXPECT_EQ(OCINlsCharSetNameToId(env_, Text("al32Utf8")), 873);
    for (const char* const name : {"none", "UTF8\x81"}) EXPECT_EQ(OCINlsCharSetNameToId(env_, Text(name)), 0);
    EXPECT_EQ(OCINlsCharSetNameToId(nullptr, Text("UTF8")), 0);
    for (const auto& [room, id] : {std::pair(0, 871), {4, 871}, {9, 7}})
        EXPECT_EQ(OCINlsCharSetIdToName(env_, Text(text), room, id), OCI_ERROR) << room;
    const struct { ub2 item; const char* text; } items[] = {
        {1, "Sunday"}, {7, "Saturday"}, {8, "Sun"}, {14, "Sat"}, {15, "January"}, {26, "December"}, {27, "Jan"},
        {38, "Dec"}, {41, "AM"}, {42, "PM"}, {43, "AD"}, {44, "BC"}, {45, "."}, {46, ","}, {49, "DD-MON-RR"},
        {50, "AMERICA"}, {51, "$"}, {52, "AMERICAN"}, {54, "AMERICA"}, {55, "WE8MSWIN1252"}};
    for (const auto& c : items) {
        EXPECT_EQ(Answer(OCINlsGetInfo(env_, err_, Text(text), sizeof text, c.item)), 0);
        EXPECT_STREQ(text, c.text);
    }
    for (const ub2 item : {0, 39, 40, 47, 53, 56, 91}) EXPECT_EQ(Answer(OCINlsGetInfo(env_, err_, Text(text), sizeof text, item)), 12702);
    EXPECT_EQ(Answer(OCINlsGetInfo(env_, err_, Text(text), 6, 1)), 22059);
    EXPECT_EQ(OCINlsCharSetNameToId(env_, nullptr), 0);
    const struct { ub2 item; sb4 value; } numbers[] = {{91, 1}, {92, 1}, {93, 178}, {94, 1000}};
    for (const auto& c : numbers) {
        sb4 value = -1;
        EXPECT_EQ(Answer(OCINlsNumericInfoGet(env_, err_, &value, c.item)), 0);
        EXPECT_EQ(value, c.value) << c.item;
    }
    ub2 id = 0;
    EXPECT_EQ(OCINlsEnvironmentVariableGet(&id, 0, OCI_NLS_CHARSET_ID, 0, nullptr), OCI_SUCCESS);
    EXPECT_GT(id, 0);
    EXPECT_EQ(OCINlsEnvironmentVariableGet(&id, 2, OCI_NLS_CHARSET_ID, 0, nullptr), OCI_SUCCESS);
    setenv("LC_ALL", "no_such.locale", 1);
    EXPECT_EQ(OCINlsEnvironmentVariableGet(&id, 0, OCI_NLS_CHARSET_ID, 0, nullptr), OCI_SUCCESS);
    EXPECT_EQ(id, 873);
    unsetenv("LC_ALL");
    EXPECT_EQ(OCINlsEnvironmentVariableGet(&id, 1, OCI_NLS_CHARSET_ID, 0, nullptr), OCI_ERROR);
    OCIEnv* none = nullptr;
    for (const auto& [set, national] : {std::pair(7, 0), {873, 7}})
        EXPECT_EQ(OCIEnvNlsCreate(&none, 0, nullptr, nullptr, nullptr, nullptr, 0, nullptr, set, national), OCI_ERROR);
    EXPECT_EQ(none, nullptr);
    Nls(0, 31, OCI_UTF16);
    EXPECT_EQ(Attribute<ub2>(env_, OCI_HTYPE_ENV, OCI_ATTR_CHARSET_ID), 1000);
    Nls(2000);
    for (const size_t room : {9u, 10u})
        EXPECT_EQ(OCINlsCharSetIdToName(env_, Text(text), room, 871), room == 10 ? OCI_SUCCESS : OCI_ERROR);
    EXPECT_EQ(std::string_view(text, 10), std::string_view("\0U\0T\0F\0" "8\0", 10));
}

TEST_F(NlsCalls, StatementsSpeakTheSetOfTheirEnvironment) {
    Nls(178, 171);
    EXPECT_EQ(Attribute<ub2>(env_, OCI_HTYPE_ENV, OCI_ATTR_CHARSET_ID), 178);
    EXPECT_EQ(Attribute<ub2>(env_, OCI_HTYPE_ENV, OCI_ATTR_NCHARSET_ID), 171);
    OCISvcCtx* svc = nullptr;
    ASSERT_EQ(LogOn(&svc, ":memory:"), 0);
    StatementCalls calls{env_, err_, svc, New<OCIStmt>(OCI_HTYPE_STMT)};
    const auto set = [&](dvoid* handle, ub4 type, ub4 attribute, auto value) {
        return Answer(OCIAttrSet(handle, type, &value, 0, attribute, err_));
    };
    auto* const session = New<OCISession>(OCI_HTYPE_SESSION);
    MUST(Answer(OCIAttrSet(session, OCI_HTYPE_SESSION, const_cast<char*>("\xe4"), 1, OCI_ATTR_CURRENT_SCHEMA, err_)));
    EXPECT_STREQ(Attribute<const char*>(session, OCI_HTYPE_SESSION, OCI_ATTR_CURRENT_SCHEMA), "\xe4");
    // What is bound and read back: in the environment's own set, in the national one, in one that is told.
    const struct { ub1 form; ub2 set; std::string_view in, out; } cases[] = {
        {SQLCS_IMPLICIT, 0, "\x80", "\xe9\x80  "}, {SQLCS_NCHAR, 0, "\xc4", "\xe9?  "},
        {SQLCS_IMPLICIT, 873, "€", "\xe9\x80  "}};
    for (const auto& c : cases) {
        OCIBind* bind = nullptr;
        char value[4] = "", area[8] = "";
        c.in.copy(value, sizeof value);
        MUST(calls.Prepare("select '\xe9' || :v as \"\xe4\" from dual"),
             calls.Bind(&bind, 1, {value, static_cast<sb4>(c.in.size()), SQLT_CHR}),
             set(bind, OCI_HTYPE_BIND, OCI_ATTR_CHARSET_FORM, c.form),
             set(bind, OCI_HTYPE_BIND, OCI_ATTR_CHARSET_ID, c.set),
             calls.Define(1, {area, 4, SQLT_AFC}), calls.Execute());
        EXPECT_EQ(std::string_view(area, 4), c.out);
        EXPECT_EQ(set(bind, OCI_HTYPE_BIND, OCI_ATTR_CHARSET_ID, ub2{7}), 24329);
    }
    OCIDefine* padded = nullptr;
    char area[8] = "";
    MUST(calls.Prepare("select '\xe9' as \"\xe4\" from dual"), calls.Define(&padded, 1, {area, 8, SQLT_AFC}),
         set(padded, OCI_HTYPE_DEFINE, OCI_ATTR_CHARSET_ID, ub2{2000}), calls.Execute());
    EXPECT_EQ(std::string_view(area, 8), std::string_view("\0\xe9\0 \0 \0 ", 8));
    EXPECT_EQ(calls.ColumnName(calls.Column(1)), "\xe4");
    auto* const lob = calls.NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
    ub4 amount = 0;
    area[0] = '\xc4';
    MUST(OCILobCreateTemporary(svc, err_, lob, 0, SQLCS_NCHAR, OCI_TEMP_NCLOB, FALSE, OCI_DURATION_SESSION),
         OCILobWrite(svc, err_, lob, &amount, 1, area, 1, OCI_ONE_PIECE, nullptr, nullptr, 171, SQLCS_NCHAR));
    for (const ub1 form : {SQLCS_NCHAR, SQLCS_IMPLICIT})
        EXPECT_EQ(OCILobRead(svc, err_, lob, &(amount = 0), 1, area + form, 1, nullptr, nullptr, 0, form), OCI_SUCCESS);
    EXPECT_EQ(std::string_view(area, 3), "\xc4?\xc4");
    // Bytes that are no text.
    EXPECT_EQ(calls.Prepare("select '\x81' from dual"), 24501);
    EXPECT_EQ(calls.Prepare({"select 1 from dual\0\x81", 20}), 0) << "it ends at its zero";
    const auto prepare = [&](const char* sql, const char* tag) {
        return Answer(OCIStmtPrepare2(svc, &calls.stmt, err_, Text(sql), Length(sql), Text(tag), Length(tag),
                                      OCI_NTV_SYNTAX, OCI_DEFAULT));
    };
    EXPECT_EQ(prepare("select '\x81' from dual", "a"), 24501);
    EXPECT_EQ(prepare("select 1 from dual", "\x81"), 24501);
    EXPECT_EQ(prepare("select 1 from dual", "a"), 0);
    EXPECT_EQ(calls.BindName(":\x81", {area, 8, SQLT_AFC}), 24501);
    EXPECT_EQ(Answer(OCIStmtRelease(calls.stmt, err_, Text("\x81"), 1, OCI_DEFAULT)), 24501);
    SHOULD(Answer(OCIStmtRelease(calls.stmt, err_, nullptr, 0, OCI_DEFAULT)), Answer(OCILogoff(svc, err_)));
}

// Each text of the calls on values, where it has a byte that the environment's set lacks.
TEST_F(NlsCalls, TextsOfValuesThatAreNone) {
    Nls(178);
    OCINumber number{};
    OCIDate day{};
    auto* const moment = NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    auto* const interval = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    OraText area[80];
    ub4 size = sizeof area;
    OCINumberSetZero(err_, &number);
    ub1 exists = 0;
    MUST(Answer(OCIDateSysDate(err_, &day)), Answer(OCIDateTimeSysTimeStamp(env_, err_, moment)), OCIFileInit(env_, err_));
    const OraText *const bad = Text("\x81"), *const one = Text("1"), *const nine = Text("9"), *const year = Text("Y");
    const sb4 answers[] = {
        Answer(OCINumberToText(err_, &number, bad, 1, nullptr, 0, &size, area)),
        Answer(OCINumberToText(err_, &number, nine, 1, bad, 1, &size, area)),
        Answer(OCINumberFromText(err_, bad, 1, nine, 1, nullptr, 0, &number)),
        Answer(OCINumberFromText(err_, one, 1, bad, 1, nullptr, 0, &number)),
        Answer(OCINumberFromText(err_, one, 1, nine, 1, bad, 1, &number)),
        Answer(OCIDateToText(err_, &day, bad, 1, nullptr, 0, &size, area)),
        Answer(OCIDateToText(err_, &day, year, 1, bad, 1, &size, area)),
        Answer(OCIDateFromText(err_, bad, 1, year, 1, nullptr, 0, &day)),
        Answer(OCIDateFromText(err_, one, 1, bad, 1, nullptr, 0, &day)),
        Answer(OCIDateFromText(err_, one, 1, year, 1, bad, 1, &day)),
        Answer(OCIDateNextDay(err_, &day, bad, 1, &day)),
        Answer(OCIDateTimeToText(env_, err_, moment, bad, 1, 0, nullptr, 0, &size, area)),
        Answer(OCIDateTimeToText(env_, err_, moment, year, 1, 0, bad, 1, &size, area)),
        Answer(OCIDateTimeFromText(env_, err_, bad, 1, year, 1, nullptr, 0, moment)),
        Answer(OCIDateTimeFromText(env_, err_, one, 1, bad, 1, nullptr, 0, moment)),
        Answer(OCIDateTimeFromText(env_, err_, one, 1, year, 1, bad, 1, moment)),
        Answer(OCIDateTimeConstruct(env_, err_, moment, 2024, 2, 29, 0, 0, 0, 0, const_cast<OraText*>(bad), 1)),
        Answer(OCIFileExists(env_, err_, const_cast<OraText*>(bad), const_cast<OraText*>(one), &exists)),
        Answer(OCIFileExists(env_, err_, const_cast<OraText*>(one), const_cast<OraText*>(bad), &exists)),
        Answer(OCIIntervalFromText(env_, err_, bad, 1, interval))};
    for (std::size_t index = 0; index < std::size(answers); ++index) EXPECT_EQ(answers[index], 24501) << index;
    for (const ub4 room : {2U, 0x7FFFFFFFU})
        EXPECT_EQ(Answer(OCINumberToText(err_, &number, nine, 1, nullptr, 0, &(size = room), area)), 0) << room;
}

}  // namespace
