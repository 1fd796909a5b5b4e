// Every number that is an attribute of something, over every kind of handle: what can be read, in which width, what can
// be set and read back, and 24315 for everything else.
#include <map>

#include "support/call_fixture.h"

namespace {

// Letters of kinds: e environment, r error, c service context, s statement, b bind, d define, D describe, v server,
// u session, t transaction, x subscription, n snapshot; of parameters: i of a select list, k of a table's columns,
// T table, V view, L list, S schema, B database, m object in a list. `get`: a letter and its width: 1, 2, 4, 8 bytes,
// t text, h handle, g an identifier of 140 bytes, w a descriptor that this is none of; "*" stands for all the others.
struct Known { ub4 number; const char* get; const char* set; };
constexpr Known kKnown[] = {
    {1, "e4r4i2k2", ""}, {2, "e4i2k2", ""}, {3, "v1c1i4k4", "vc"}, {4, "r4itktTtVtStBtmt", ""}, {5, "i2k1*h", ""},
    {6, "chi1k1", "c"}, {7, "chi1k1", "c"}, {8, "chitkt", "c"}, {9, "s4itkt", ""}, {10, "s2", ""}, {11, "s4i2k2", "s"},
    {12, "s4", "s"}, {13, "s4", "s"}, {14, "s4", "s"}, {15, "b4d4", "bd"}, {16, "b2d2", "bd"}, {17, "b2d2", "bd"},
    {18, "s4D4", ""}, {19, "sw", ""}, {22, "ut", "u"}, {23, "", "u"}, {24, "s2", ""}, {25, "vt", "v"}, {26, "vt", "v"},
    {27, "tg", "t"}, {28, "t4", ""}, {29, "tt", "t"}, {30, "e4", ""}, {31, "e2b2d2i2k2B2", "bd"},
    {32, "b1d1i1k1", "bd"}, {33, "b4", "b"}, {34, "e4", "e"}, {35, "e4", "e"}, {36, "e2", "e"}, {37, "e2", "e"},
    {38, "e2", "e"}, {42, "b4", ""}, {43, "", "v"}, {44, "c1v1", ""}, {73, "s4", ""}, {74, "r4", ""}, {84, "e4", ""},
    {85, "vt", "v"}, {86, "", "u"}, {94, "xt", "x"}, {95, "xh", "x"}, {96, "xh", "x"}, {98, "x4", "x"}, {99, "", "u"},
    {100, "", "u"}, {102, "T2V2", ""}, {103, "ThVh", ""}, {104, "T4", ""}, {105, "T1", ""}, {106, "T1", ""},
    {107, "T1", ""}, {110, "ihkh", ""}, {121, "L2", ""}, {122, "T4V4", ""}, {123, "i1k1T1V1L1S1B1m1", ""},
    {124, "Dh", ""}, {126, "T4", ""}, {128, "L2", ""}, {129, "s2", ""}, {130, "T1", ""}, {131, "T1", ""},
    {132, "T2", ""}, {134, "TtVtStBtmt", ""}, {135, "TtVtmt", ""}, {136, "T4V4", ""}, {142, "t4", "t"},
    {143, "v4", ""}, {144, "st", ""}, {163, "b4d4", "bd"}, {164, "s4", ""}, {176, "c4", "c"}, {182, "s4", ""},
    {188, "u4", ""}, {190, "s4", ""}, {191, "b4d4", ""}, {193, "v1", ""}, {197, "s4", ""}, {198, "n4", "n"},
    {199, "n4", "n"}, {209, "e1", ""}, {218, "s1Bt", ""}, {224, "ut", "u"}, {250, "", "D"}, {261, "Sh", ""},
    {262, "e2B2", ""}, {263, "Bh", ""}, {264, "B4", ""}, {265, "B4", ""}, {266, "B1", ""}, {267, "B1", ""},
    {268, "B1", ""}, {269, "B1", ""}, {270, "B1", ""}, {271, "B1", ""}, {272, "B1", ""}, {278, "", "u"}, {284, "", "D"},
    {285, "i1k1", ""}, {286, "i2k2", ""}, {288, "ut", "u"}, {306, "*h", ""}, {366, "", "u"}, {367, "", "u"},
    {368, "", "u"}, {391, "vt", ""}, {424, "", "u"}, {425, "ut", "u"}, {426, "u4", "u"}, {457, "s8", ""}};

struct Handle { dvoid* pointer; ub4 type; };

class AttributesTest : public CallFixture {
protected:
    void SetUp() override {
        CallFixture::SetUp();
        MakeDatabase();
        ASSERT_EQ(LogOn(&svc_, Database()), 0);
        stmt_ = New<OCIStmt>(OCI_HTYPE_STMT);
        for (const char* sql : {"create table t(a number(5,2) not null, b timestamp(3), c nvarchar2(7))",
                                "create view v as select a from t", "insert into t values(1, null, 'x')"}) {
            ASSERT_EQ(Run(svc_, sql), 0) << sql;
        }
    }
    void TearDown() override {
        OCILogoff(svc_, err_);
        CallFixture::TearDown();
    }
    [[nodiscard]] const char* Database() const { return OnServer() ? "work" : ":memory:"; }
    sb4 Describe(OCIDescribe* describe, const char* name, ub1 type, ub1 pointer = OCI_OTYPE_NAME, ub1 level = 0) {
        return Answer(OCIDescribeAny(svc_, err_, Text(name), Length(name), pointer, level, type, describe));
    }
    dvoid* Described(const char* name, ub1 type) {
        auto* describe = New<OCIDescribe>(OCI_HTYPE_DESCRIBE);
        EXPECT_EQ(Describe(describe, name, type), 0) << name;
        return Attribute<dvoid*>(describe, OCI_HTYPE_DESCRIBE, OCI_ATTR_PARAM);
    }
    dvoid* Below(dvoid* parameter, ub4 list, ub4 position) {
        dvoid* found = nullptr;
        EXPECT_EQ(Member(Attribute<dvoid*>(parameter, OCI_DTYPE_PARAM, list), &found, position), 0) << position;
        return found;
    }
    sb4 Member(dvoid* of, dvoid** found, ub4 position, ub4 type = OCI_DTYPE_PARAM) const {
        return Answer(OCIParamGet(of, type, err_, found, position));
    }
    [[nodiscard]] std::string Name(dvoid* of, ub4 attribute, ub4 type = OCI_DTYPE_PARAM) const {
        const char* text = nullptr;
        ub4 size = 0;
        const sb4 answer = Answer(OCIAttrGet(of, type, &text, &size, attribute, err_));
        return answer == 0 ? std::string(text, size) : "!" + std::to_string(answer);
    }
    sb4 Set(dvoid* on, ub4 type, ub4 attribute, dvoid* value, ub4 size = 0) const {
        return Answer(OCIAttrSet(on, type, value, size, attribute, err_));
    }
    std::map<char, Handle> OneOfEach();
    void Check(char kind, const Handle& handle, const Known& known);

    OCISvcCtx* svc_ = nullptr;
    OCIStmt* stmt_ = nullptr;
};

std::map<char, Handle> AttributesTest::OneOfEach() {
    auto* svc = New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
    auto* server = New<OCIServer>(OCI_HTYPE_SERVER);
    EXPECT_EQ(Answer(OCIServerAttach(server, err_, Text(":memory:"), 8, OCI_DEFAULT)), 0);
    EXPECT_EQ(Set(svc, OCI_HTYPE_SVCCTX, OCI_ATTR_SERVER, server), 0);
    static OCIBind* bind = nullptr;
    static OCIDefine* define = nullptr;
    static sb4 number = 0;
    bind = nullptr, define = nullptr;
    const char* sql = "select a from t where a = :1";
    OCIStmtPrepare(stmt_, err_, Text(sql), Length(sql), OCI_NTV_SYNTAX, OCI_DEFAULT);
    EXPECT_EQ(Answer(OCIBindByPos(stmt_, &bind, err_, 1, &number, 4, SQLT_INT, nullptr, nullptr, nullptr, 0, nullptr,
                                  OCI_DEFAULT)), 0);
    EXPECT_EQ(Answer(OCIDefineByPos(stmt_, &define, err_, 1, &number, 4, SQLT_INT, nullptr, nullptr, nullptr,
                                    OCI_DEFAULT)), 0);
    EXPECT_EQ(Answer(OCIStmtExecute(svc_, stmt_, err_, 0, 0, nullptr, nullptr, OCI_DEFAULT)), 0);
    dvoid *item = nullptr, *snapshot = nullptr;
    EXPECT_EQ(Member(stmt_, &item, 1, OCI_HTYPE_STMT), 0);
    EXPECT_EQ(OCIDescriptorAlloc(env_, &snapshot, OCI_DTYPE_SNAP, 0, nullptr), OCI_SUCCESS);
    auto* describe = New<OCIDescribe>(OCI_HTYPE_DESCRIBE);
    EXPECT_EQ(Describe(describe, "t", OCI_PTYPE_TABLE), 0);
    dvoid* table = Attribute<dvoid*>(describe, OCI_HTYPE_DESCRIBE, OCI_ATTR_PARAM);
    dvoid* schema = Described("main", OCI_PTYPE_SCHEMA);
    const ub4 parameter = OCI_DTYPE_PARAM;
    return {{'e', {env_, OCI_HTYPE_ENV}}, {'r', {New<OCIError>(OCI_HTYPE_ERROR), OCI_HTYPE_ERROR}},
            {'c', {svc, OCI_HTYPE_SVCCTX}}, {'s', {stmt_, OCI_HTYPE_STMT}}, {'b', {bind, OCI_HTYPE_BIND}},
            {'d', {define, OCI_HTYPE_DEFINE}}, {'D', {describe, OCI_HTYPE_DESCRIBE}},
            {'v', {New<OCIServer>(OCI_HTYPE_SERVER), OCI_HTYPE_SERVER}},
            {'u', {New<OCISession>(OCI_HTYPE_SESSION), OCI_HTYPE_SESSION}},
            {'t', {New<OCITrans>(OCI_HTYPE_TRANS), OCI_HTYPE_TRANS}},
            {'x', {New<dvoid>(OCI_HTYPE_SUBSCRIPTION), OCI_HTYPE_SUBSCRIPTION}}, {'n', {snapshot, OCI_DTYPE_SNAP}},
            {'i', {item, parameter}}, {'k', {Below(table, OCI_ATTR_LIST_COLUMNS, 1), parameter}},
            {'T', {table, parameter}}, {'V', {Described("v", OCI_PTYPE_VIEW), parameter}},
            {'L', {Attribute<dvoid*>(table, parameter, OCI_ATTR_LIST_COLUMNS), parameter}}, {'S', {schema, parameter}},
            {'B', {Described("memory", OCI_PTYPE_DATABASE), parameter}},
            {'m', {Below(schema, OCI_ATTR_LIST_OBJECTS, 0), parameter}}};
}

char WidthOf(const char* get, char kind) {
    char others = 0;
    for (; *get != 0; get += 2) {
        if (get[0] == kind) return get[1];
        if (get[0] == '*') others = get[1];
    }
    return others;
}

void AttributesTest::Check(char kind, const Handle& handle, const Known& known) {
    SCOPED_TRACE(std::string("attribute ") + std::to_string(known.number) + " of " + kind);
    const char width = WidthOf(known.get, kind);
    const bool is_set = std::strchr(known.set, kind) != nullptr;
    unsigned char area[256], untouched[256];
    std::memset(area, 0xEE, sizeof area);
    std::memset(untouched, 0xEE, sizeof untouched);
    ub4 size = 7777;
    const auto get = [&] { return Answer(OCIAttrGet(handle.pointer, handle.type, area, &size, known.number, err_)); };
    const sb4 answer = get();
    const bool is_integer = width >= '1' && width <= '8';
    const size_t bytes = is_integer ? width - '0' : width == 't' || width == 'h' ? 8 : width == 'g' ? 140 : 0;
    EXPECT_EQ(answer, width == 0 ? 24315 : width == 'w' ? OCI_INVALID_HANDLE : 0);
    EXPECT_EQ(std::memcmp(area + bytes, untouched, sizeof area - bytes), 0) << "more than its width is written";
    if (bytes > 0 && width != 't') {
        EXPECT_EQ(size, bytes);
        EXPECT_EQ(Answer(OCIAttrGet(handle.pointer, handle.type, nullptr, &size, known.number, err_)), 21560);
    }
    ub4 value = known.number == OCI_ATTR_CHARSET_ID ? 873 : width == '4' ? 0x10000 + known.number : 1;
    static char identifier[140] = "xid";
    dvoid* pointer = nullptr;
    if (width == 'h' && known.number < 90) std::memcpy(&pointer, area, sizeof pointer);
    const ub4 number = known.number;
    const bool is_text = number == OCI_ATTR_PASSWORD || number == OCI_ATTR_CLIENT_IDENTIFIER || number > 360;
    if (width == 't' || is_text) pointer = const_cast<char*>("MAIN");
    if (is_integer || handle.type == OCI_HTYPE_DESCRIBE) pointer = &value;
    if (width == 'g' || (width == 'h' && kind == 'x')) pointer = identifier;
    EXPECT_EQ(Set(handle.pointer, handle.type, number, pointer, width == 'g' ? 140 : pointer ? 4 : 0), is_set ? 0 : 24315);
    if (!is_set || width == 0) return;
    ASSERT_EQ(get(), 0);
    ub4 read = 0;
    if (is_integer) std::memcpy(&read, area, bytes);
    EXPECT_EQ(read, is_integer ? value : 0) << "read back";
    EXPECT_TRUE(width != 't' || Name(handle.pointer, known.number, handle.type) == "MAIN");
    EXPECT_TRUE(width != 'h' || std::memcmp(area, &pointer, sizeof pointer) == 0);
    EXPECT_TRUE(width != 'g' || std::memcmp(area, identifier, 140) == 0);
}

TEST_F(AttributesTest, EveryNumberOverEveryKind) {
    std::map<char, Handle> handles = OneOfEach();
    char others = 0;    // that only keep what all handles keep
    for (const ub4 type : {OCI_HTYPE_COMPLEXOBJECT, OCI_HTYPE_SECURITY, OCI_HTYPE_DIRPATH_CTX, OCI_HTYPE_DIRPATH_COLUMN_ARRAY,
                           OCI_HTYPE_DIRPATH_STREAM, OCI_HTYPE_PROC, OCI_HTYPE_DIRPATH_FN_CTX, OCI_HTYPE_DIRPATH_FN_COL_ARRAY,
                           OCI_HTYPE_XADSESSION, OCI_HTYPE_XADTABLE, OCI_HTYPE_XADFIELD, OCI_HTYPE_XADGRANULE,
                           OCI_HTYPE_XADRECORD, OCI_HTYPE_XADIO, OCI_HTYPE_ADMIN})
        handles[++others] = {New<dvoid>(type), type};
    std::map<ub4, Known> known;
    for (const Known& row : kKnown) known[row.number] = row;
    for (ub4 number = 0; number <= 600; ++number) {
        const Known row = known.contains(number) ? known[number] : Known{number, "", ""};
        for (const auto& [kind, handle] : handles) Check(kind, handle, row);
    }
}

static_assert(sizeof(utext) == 2 && UB4MAXVAL + 1 == UB4MINVAL && SB4MINVAL < SB4MAXVAL && SQLT_AFV == 97);
static_assert(OCI_TYPECODE_BFLOAT == 100 && OCI_TYPECODE_BDOUBLE == 101 && OCI_FO_REAUTH == 4 && OCI_FO_TXNAL == 8);

TEST_F(AttributesTest, ParametersLiveWithTheirHandle) {
    auto* describe = New<OCIDescribe>(OCI_HTYPE_DESCRIBE);
    ASSERT_EQ(Describe(describe, "T", OCI_PTYPE_TABLE), 0);
    dvoid *root = nullptr, *again = nullptr, *memory = nullptr;
    ASSERT_EQ(Member(describe, &root, 1, OCI_HTYPE_DESCRIBE), 0);
    for (ub4 position = 1; position <= 3; ++position) again = Below(root, OCI_ATTR_LIST_COLUMNS, position);
    const sb4 blocks = OCI_memGetMemCount();
    EXPECT_EQ(Below(root, OCI_ATTR_LIST_COLUMNS, 3), again) << "the same one when asked again";
    EXPECT_EQ(OCI_memGetMemCount(), blocks);
    EXPECT_EQ(OCIDescriptorFree(root, OCI_DTYPE_PARAM), OCI_SUCCESS);
    EXPECT_EQ(Name(again, OCI_ATTR_NAME), "C") << "its object's parameter is gone, its handle lives";
    ASSERT_EQ(Member(describe, &root, 1, OCI_HTYPE_DESCRIBE), 0);
    auto* const columns = Attribute<dvoid*>(root, OCI_DTYPE_PARAM, OCI_ATTR_LIST_COLUMNS);
    ASSERT_EQ(OCIDescriptorAlloc(env_, &again, OCI_DTYPE_PARAM, 8, &memory), OCI_SUCCESS);
    EXPECT_EQ(Attribute<dvoid*>(again, OCI_DTYPE_PARAM, OCI_ATTR_USER_MEMORY), memory);
    EXPECT_EQ(Attribute<OCIEnv*>(again, OCI_DTYPE_PARAM, OCI_ATTR_ENV), env_);
    EXPECT_EQ(Member(again, &again, 1), 24334) << "of nothing";
    MUST(Run(svc_, "drop view v"), Run(svc_, "drop table t"));
    EXPECT_EQ(Name(root, OCI_ATTR_OBJ_NAME), "T") << "as it was";
    EXPECT_EQ(Describe(describe, OnServer() ? "public" : "main", OCI_PTYPE_SCHEMA), 0);
    EXPECT_EQ(OCIDescriptorFree(columns, OCI_DTYPE_PARAM), OCI_INVALID_HANDLE) << "gone with what it described";
    dvoid* const database = Described(OnServer() ? ann_.substr(4).c_str() : "memory", OCI_PTYPE_DATABASE);
    EXPECT_EQ(Attribute<ub1>(database, OCI_DTYPE_PARAM, OCI_ATTR_NOWAIT_SUPPORT),
              OnServer() ? OCI_NW_SUPPORTED : OCI_NW_UNSUPPORTED);
}

}  // namespace
