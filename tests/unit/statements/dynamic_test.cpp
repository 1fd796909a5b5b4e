// Binds and defines whose places callbacks give: what they are asked, what becomes of their answers, and what they may
// do meanwhile.
#include <functional>

#include "support/statement_fixture.h"

namespace {

using std::string;

// A callback for either direction. It notes what it is asked: iteration, index, piece.
struct Callback {
    struct Place { dvoid* buffer = nullptr; ub4 length = 0; ub1 piece = 0; dvoid* indicator = nullptr; };
    std::function<sb4(Place&)> act;
    string asked;
    Place place;    // of the last call; its length lives here
    ub2 code = 9;
    bool tells_code = true;

    sb4 Ask(ub4 iteration, ub4 index, ub1 piece) {
        asked += std::to_string(iteration) + "." + std::to_string(index) + "." + std::to_string(piece) + " ";
        Place given{nullptr, 0, piece, nullptr};
        const sb4 answer = act(given);
        place = given;
        return answer;
    }
    static sb4 In(dvoid* context, OCIBind*, ub4 iteration, ub4 index, dvoid** buffer, ub4* length, ub1* piece,
                  dvoid** indicator) {
        auto& self = *static_cast<Callback*>(context);
        const sb4 answer = self.Ask(iteration, index, *piece);
        *buffer = self.place.buffer, *length = self.place.length, *piece = self.place.piece;
        *indicator = self.place.indicator;
        return answer;
    }
    static sb4 Out(dvoid* context, OCIBind*, ub4 iteration, ub4 index, dvoid** buffer, ub4** length, ub1* piece,
                   dvoid** indicator, ub2** code) {
        auto& self = *static_cast<Callback*>(context);
        const sb4 answer = self.Ask(iteration, index, *piece);
        *buffer = self.place.buffer, *length = &self.place.length, *piece = self.place.piece;
        *indicator = self.place.indicator, *code = self.tells_code ? &self.code : nullptr;
        return answer;
    }
    static sb4 Define(dvoid* context, OCIDefine*, ub4 row, dvoid** buffer, ub4** length, ub1* piece, dvoid** indicator,
                      ub2** code) {
        return Out(context, nullptr, row, 0, buffer, length, piece, indicator, code);
    }
};

// Gives pieces one after another: "=" marks a whole value, "<" a first piece, "+" a next and ">" a last one, "0" a null.
struct Giver : Callback {
    explicit Giver(std::vector<string> given) : pieces(std::move(given)) {
        act = [this](Place& out) {
            const string& piece = pieces.at(next++);
            out.piece = static_cast<ub1>(string("=<+>").find(piece[0]));
            if (piece == "0") out.piece = OCI_ONE_PIECE, out.indicator = &null;
            out.buffer = const_cast<char*>(piece.data()) + 1;
            out.length = static_cast<ub4>(piece.size()) - 1;
            return OCI_CONTINUE;
        };
    }
    std::vector<string> pieces;
    std::size_t next = 0;
    sb2 null = -1;
};

// Takes values in pieces of at most `room` bytes: `all` gets them, with | behind each and - for a null. Nothing but the
// piece's bytes is touched.
struct Taker : Callback {
    explicit Taker(ub4 size) : room(size) {
        act = [this](Place& out) {
            if (out.piece == OCI_ONE_PIECE) Flush();
            else all += Bytes();
            buffer.assign(room + 1, '#');
            indicator = 9;
            out = {buffer.data(), room, out.piece, &indicator};
            return OCI_CONTINUE;
        };
    }
    [[nodiscard]] string Bytes() const {
        EXPECT_EQ(buffer.back(), '#');
        return buffer.substr(0, place.length);
    }
    string Flush() {
        if (!buffer.empty()) all += indicator == -1 ? "-|" : Bytes() + "|";
        buffer.clear();
        return all;
    }
    ub4 room;
    string buffer, all;
    sb2 indicator = 9;
};

class Dynamic : public StatementTest {
protected:
    sb4 BindTo(ub4 position, Callback* in, Callback* out, ub2 type = SQLT_CHR) {
        OCIBind*& bind = binds_[position];
        bind = nullptr;
        const sb4 answer = Bind(&bind, position, InPieces(type));
        return answer != 0 ? answer : Answer(OCIBindDynamic(bind, err, in, in ? Callback::In : nullptr, out,
                                                            out ? Callback::Out : nullptr));
    }
    sb4 DefineTo(ub4 position, Callback& taker, ub2 type = SQLT_CHR) {
        OCIDefine*& define = defines_[position];
        define = nullptr;
        const sb4 answer = Define(&define, position, InPieces(type));
        return answer != 0 ? answer : Answer(OCIDefineDynamic(define, err, &taker, Callback::Define));
    }
    OCIBind* binds_[4] = {};
    OCIDefine* defines_[4] = {};
};

// Variables of a block: what goes in is read, what was assigned comes out; elements of tables each in their turn.
TEST_F(Dynamic, BlocksAndTables) {
    MustRun("create table t(a varchar2(40))");
    Giver giver({"<ab", ">c", "=x"}), elements({"=p", "=q", "=r", "=s"});
    Taker taker(10), rows(10);
    ub4 count = 2;
    ASSERT_EQ(Prepare("begin :v := :v || :v; insert into t values(:v); insert into t values(:e) returning a || '!' into :e; end;"), 0);
    MUST(BindTo(1, &giver, &taker), Bind(&binds_[2], 2, InPieces(SQLT_CHR), OCI_DEFAULT, 2, &count));
    MUST(Answer(OCIBindDynamic(binds_[2], err, &elements, Callback::In, &rows, Callback::Out)), Execute(2));
    EXPECT_EQ(elements.asked, "0.0.0 0.1.0 1.0.0 1.1.0 ");
    EXPECT_EQ(rows.asked, elements.asked);
    EXPECT_EQ(rows.Flush(), "p!|q!|r!|s!|");
    EXPECT_EQ(taker.Flush(), "abcabc|xx|");
    EXPECT_EQ(One("select group_concat(a, ',') from t"), "abcabc,p,q,xx,r,s");
    count = 3, giver.next = 0;
    EXPECT_EQ(Execute(1), 1414) << "more elements than room";
    Taker selected(9);
    ASSERT_EQ(Prepare("begin select a into :e from t where length(a) = 1 order by a; end;"), 0);
    ASSERT_EQ(Bind(&binds_[1], 1, InPieces(SQLT_CHR), OCI_DEFAULT, 4, &(count = 0)), 0);
    MUST(Answer(OCIBindDynamic(binds_[1], err, &elements, Callback::In, &selected, Callback::Out)), Execute());
    EXPECT_EQ(selected.Flush(), "p|q|r|s|");
    ASSERT_EQ(Bind(&binds_[1], 1, InPieces(SQLT_CHR), OCI_DEFAULT, 4, &count), 0);
    EXPECT_EQ(ExecuteCode(), OCI_NEED_DATA) << "bound anew it has no callbacks";
}

// What callbacks do to what calls them. The statement itself is closed; the rest of the session is not.
TEST_F(Dynamic, CallbacksThatCallTheLibrary) {
    constexpr sb4 kNotAsked = -1;
    MustRun("create table t(a varchar2(40))");
    sb4 numbers[2] = {};
    OCIBind* plain_bind = nullptr;
    OCIDefine* plain_define = nullptr;
    const struct { std::function<sb4()> act; sb4 answer, in, out, number; } cases[] = {
        {[&] { return Fetch(); }, 3127, 0, 0, 8}, {[&] { return Execute(); }, 3127, 0, 0, 8},
        {[&] { return Prepare("select 1 from dual"); }, 3127, 0, 0, 8},
        {[&] { return Bind(1, Int(numbers)); }, 3127, 0, 0, 8}, {[&] { return Define(1, Int(numbers)); }, 3127, 0, 0, 8},
        {[&] { return One("select 'other' from dual") == "other" ? 0 : 1; }, 0, 0, 0, 8},
        {[&] { return OCIHandleFree(binds_[1], OCI_HTYPE_BIND); }, 0, 1008, kNotAsked, 0},
        {[&] { return OCIHandleFree(plain_bind, OCI_HTYPE_BIND); }, 0, 1008, kNotAsked, 0},
        {[&] { return OCIHandleFree(defines_[1], OCI_HTYPE_DEFINE); }, 0, kNotAsked, 0, 8},
        {[&] { return OCIHandleFree(plain_define, OCI_HTYPE_DEFINE); }, 0, kNotAsked, 0, 7},
        {[&] { return OCIHandleFree(stmt, OCI_HTYPE_STMT); }, 0, 24370, 24370, 7},
        {[&] { return Answer(OCILogoff(svc, err)); }, 0, 3114, kNotAsked, 0},
        {[&] { return Answer(OCILogoff(svc, err)); }, 0, kNotAsked, 3114, 7}};
    for (const auto& c : cases) {
        Callback callback;
        char room[] = "xyz";
        sb4 answered = -1;
        callback.act = [&](Callback::Place& out) {
            if (answered == -1) answered = c.act();
            out = {room, 3, out.piece};
            return OCI_CONTINUE;
        };
        if (c.in != kNotAsked) {
            stmt = New<OCIStmt>(OCI_HTYPE_STMT);
            plain_bind = nullptr;
            MUST(Prepare("insert into t values(:1 || :2)"), BindTo(1, &callback, nullptr));
            ASSERT_EQ(Bind(&plain_bind, 2, Int(numbers)), 0);
            EXPECT_EQ(Execute(2), c.in) << &c - cases;
            EXPECT_EQ(answered, c.answer) << &c - cases;
            if (c.in == 3114) { ASSERT_EQ(Logon(&svc), OCI_SUCCESS); }
        }
        if (c.out == kNotAsked) continue;
        stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        plain_define = nullptr, numbers[0] = numbers[1] = 0, answered = -1;
        MUST(Prepare("select 'abc', 7 from dual union all select 'def', 8 from dual"), DefineTo(1, callback));
        ASSERT_EQ(Define(&plain_define, 2, Int(numbers)), 0);
        ASSERT_EQ(Execute(0), 0) << &c - cases;
        EXPECT_EQ(Fetch(2), c.out) << &c - cases;
        EXPECT_EQ(answered, c.answer) << &c - cases;
        EXPECT_EQ(numbers[1] == 8 ? 8 : numbers[0], c.number) << &c - cases;
    }
}

}  // namespace
