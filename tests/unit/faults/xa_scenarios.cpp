// The XA switch: a manager of the process, on a file of the world's folder, and a branch that makes two rows or none.
#include <cstring>

#include "faults/world.h"
#include "xa.h"

namespace faults {
namespace {

constexpr int kManager = 7;
XID branch{5, 2, 1, "xab"};

using Entry = int (*xa_switch_t::*)(XID*, int, xa_long);
int CallOf(Entry entry, xa_long flags) { return (rmXaSwitch.*entry)(&branch, kManager, flags); }

std::string info;    // of the manager
int Open() { return rmXaSwitch.xa_open_entry(info.data(), kManager, TMNOFLAGS); }
int Close() { return rmXaSwitch.xa_close_entry(nullptr, kManager, TMNOFLAGS); }
int Recovered() {
    XID found[2];
    const int count = rmXaSwitch.xa_recover_entry(found, 2, kManager, TMSTARTRSCAN | TMENDRSCAN);
    EXPECT_TRUE(count != 1 || std::memcmp(&found[0], &branch, sizeof branch) == 0);
    return count;
}
OCISvcCtx* Session() { return xaoSvcCtx(World::Text("faults")); }

// A call of the switch. One that memory fails in has done nothing: repeated, it answers as ever.
template <class Call>
void XaStep(World& w, const char* name, int expected, Call call) {
    int code = XA_OK;
    Attempt([&] {
        w.Step(name, [&] { return (code = call()) < 0 ? OCI_ERROR : OCI_SUCCESS; }, Told::code);
        EXPECT_EQ(code, expected) << name;
    }, [&] {
        SQLCA why{};
        const bool is_told = XaGetInfo(kManager, &why) == XA_OK;    // unless there was no memory for that, either
        EXPECT_EQ(code, XAER_RMERR) << name;
        EXPECT_TRUE(!is_told || why.sqlcode == -kOutOfMemory) << name << ": " << why.sqlcode;
        EXPECT_EQ(call(), expected) << name << ", repeated";
    });
}

// Calls for the branch, one after the other.
struct Leg { const char* name; Entry entry; xa_long flags; };
Leg Start(xa_long flags) { return {"xa_start", &xa_switch_t::xa_start_entry, flags}; }
Leg End(xa_long flags) { return {"xa_end", &xa_switch_t::xa_end_entry, flags}; }
Leg Commit(xa_long flags) { return {"xa_commit", &xa_switch_t::xa_commit_entry, flags}; }
void Go(World& w, std::initializer_list<Leg> legs) {
    for (const Leg& leg : legs) XaStep(w, leg.name, XA_OK, [&] { return CallOf(leg.entry, leg.flags); });
}

void InsertRow(World& w) {
    const Instead svc(w.svc, Session());
    w.Run("insert into x values(1)");
}

void MakeTable(World& w) {
    info = "DB=faults+SesTm=60+SqlNet=" + w.Folder() + "/xa.db";
    EXPECT_EQ(Open(), XA_OK);
    {
        const Instead svc(w.svc, Session());
        w.Sql("create table x(n number)");
    }
    EXPECT_EQ(Close(), XA_OK);
}

// Opens the manager, starts the branch and inserts; whatever becomes of that, the branch can be rolled back.
void Insert(World& w) {
    EXPECT_EQ(OCIInitialize(OCI_DEFAULT, nullptr, ApplicationMemory::Allocate, nullptr, ApplicationMemory::Release),
              OCI_SUCCESS);
    w.AtEnd([&w] {
        EXPECT_EQ(Open(), XA_OK);
        (void)CallOf(&xa_switch_t::xa_start_entry, TMRESUME);    // whatever it is now, it goes
        (void)CallOf(&xa_switch_t::xa_end_entry, TMFAIL);
        (void)CallOf(&xa_switch_t::xa_rollback_entry, TMNOFLAGS);
        EXPECT_EQ(CallOf(&xa_switch_t::xa_forget_entry, TMNOFLAGS), XAER_NOTA);
        {
            const Instead svc(w.svc, Session());
            const std::string rows = w.One("select count(*) from x");
            EXPECT_TRUE(rows == "0" || rows == "2") << rows;
            w.Sql("delete from x");
            w.Sql("commit");
        }
        EXPECT_EQ(Close(), XA_OK);
        return OCITerminate(OCI_DEFAULT);
    });
    XaStep(w, "xa_open", XA_OK, Open);
    Go(w, {Start(TMNOFLAGS)});
    InsertRow(w);
}

void SeeRows(World& w) {
    const Instead svc(w.svc, Session());
    w.See(w.One("select count(*) from x"));
}

SCENARIO(XaTwoPhases, session, MakeTable, "2;") {
    Insert(w);
    Go(w, {End(TMSUSPEND), Start(TMRESUME)});
    InsertRow(w);
    Go(w, {End(TMSUCCESS), {"xa_prepare", &xa_switch_t::xa_prepare_entry, TMNOFLAGS}});
    XaStep(w, "xa_recover", 1, Recovered);
    Go(w, {Commit(TMNOFLAGS)});
    SeeRows(w);
    XaStep(w, "xa_close", XA_OK, Close);
}

SCENARIO(XaOnePhase, session, MakeTable, "2;") {
    Insert(w);
    Go(w, {End(TMSUCCESS), Start(TMJOIN)});
    InsertRow(w);
    Go(w, {End(TMSUCCESS), Commit(TMONEPHASE)});
    SeeRows(w);
}

SCENARIO(XaRolledBack, session, MakeTable, "0;") {
    Insert(w);
    Go(w, {End(TMSUSPEND | TMMIGRATE), Start(TMRESUME), End(TMFAIL),
           {"xa_rollback", &xa_switch_t::xa_rollback_entry, TMNOFLAGS}});
    SeeRows(w);
}

}  // namespace
}  // namespace faults
