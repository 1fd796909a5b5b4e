// The XA switch, entry by entry, as a transaction manager would call it. The result is reported by its name, a failure
// with the resource manager's own diagnostics. Command thread only.
#include <algorithm>
#include <cstring>
#include <string_view>

#include "commands/families.h"
#include "core/keywords.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/memory.h"
#include "platform/client_library.h"
#include "platform/message_texts.h"

namespace {

constexpr char kCatalogue[] = "kelpsql.mo";

// --- Reports ---------------------------------------------------------------------------------------------------------

const char* NameOf(int rc) {
    const KeywordTable* row = XaReturnCodeKeywords;
    while (row->value != rc && row->value != kNotFound) ++row;
    return row->keyword;
}

void PrintSqlCode(const char* label, sb4 code) {
    if (code == 0) return Message(kOutput, "%s - SUCCESS\n", label);
    if (code == 100) return Message(kOutput, "%s - NO DATA FOUND\n", label);
    Message(kOutput, "%s - %s SQLCODE = %d\n\n", label, code < 0 ? "ERROR" : "WARNING", code);
}

// Nothing where the library has no diagnostics, or does not tell them.
void PrintDiagnostics(const char* label, int rmid) {
    constexpr size_t kLineWidth = 80;
    char text[1024];
    SQLCA diagnostics = {};
    if (Call(&ClientLibrary::XaGetInfo, rmid, &diagnostics) != XA_OK) return;
    PrintSqlCode(label, diagnostics.sqlcode);
    if (SqlcaMessageText(text, sizeof text, kLineWidth, kCatalogue, diagnostics) > 0) Message(kOutput, "%s\n", text);
    if (SqlstateMessageText(text, sizeof text, kLineWidth, kCatalogue, diagnostics.sqlstate) > 0)
        Message(kOutput, "%s\n", text);
}

void Report(const char* label, int rmid, int rc, bool failed) {
    Message(kOutput, "%s: rc = %d (%s)\n", label, rc, NameOf(rc));
    if (failed) PrintDiagnostics(label, rmid);
}

// --- Arguments -------------------------------------------------------------------------------------------------------

xa_long DecodeFlags(const char* word) {
    return static_cast<xa_long>(static_cast<ub4>(DecodeWholeWords(word, XaFlagKeywords)));
}

// False, with a complaint, when the words do not fit.
bool BuildXid(char** words, XID& xid) {
    const std::string_view global = words[1], branch = words[2];
    if (global.size() + branch.size() > XIDDATASIZE) {
        Message(kError, "XID data longer than %d bytes\n", XIDDATASIZE);
        return false;
    }
    xid.formatID = DecodeNumber(words[0]);
    xid.gtrid_length = static_cast<sb4>(global.size());
    xid.bqual_length = static_cast<sb4>(branch.size());
    global.copy(xid.data, global.size());
    branch.copy(xid.data + global.size(), branch.size());
    return true;
}

// --- Calls -----------------------------------------------------------------------------------------------------------

struct BranchCall : CommandRow {
    const char* label;
    int (*xa_switch_t::*entry)(XID* xid, int rmid, xa_long flags);
};

void RunBranchCall(const BranchCall& row, int, char** words) {
    const int rmid = DecodeNumber(words[1]);
    XID xid = {};
    if (!BuildXid(words + 2, xid)) return;
    const int rc = Call(row.entry, &xid, rmid, DecodeFlags(words[5]));
    Report(row.label, rmid, rc, rc != XA_OK);
}

constexpr BranchCall kBranchCalls[] = {
    {{Code::xastart, Words(6), "Usage: xastart <rmid> <formatID> <gtrid data> <bqual data> <xaflags>"},
     "XA Start", &xa_switch_t::xa_start_entry},
    {{Code::xaend, Words(6), "Usage: xaend <rmid> <formatID> <gtrid data> <bqual data> <xaflags>"},
     "XA End", &xa_switch_t::xa_end_entry},
    {{Code::xaprepare, Words(6), "Usage: xaprepare <rmid> <formatID> <gtrid data> <bqual data> <xaflags>"},
     "XA Prepare", &xa_switch_t::xa_prepare_entry},
    {{Code::xacommit, Words(6), "Usage: xacommit <rmid> <formatID> <gtrid data> <bqual data> <xaflags>"},
     "XA Commit", &xa_switch_t::xa_commit_entry},
    {{Code::xarollback, Words(6), "Usage: xarollback <rmid> <formatID> <gtrid data> <bqual data> <xaflags>"},
     "XA Rollback", &xa_switch_t::xa_rollback_entry},
    {{Code::xaforget, Words(6), "Usage: xaforget <rmid> <formatID> <gtrid data> <bqual data> <xaflags>"},
     "XA Forget", &xa_switch_t::xa_forget_entry},
};

// The password is written over the placeholder, and over what follows it, as far as the block goes.
constexpr size_t kRoomForPassword = 11;
void InsertPassword(char* info, size_t size) {
    char* const placeholder = std::strstr(info, "xpasswdx");
    if (placeholder == nullptr) return;
    const auto room = static_cast<size_t>(info + size - 1 - placeholder);
    std::memcpy(placeholder, start_up_password.data(), std::min(start_up_password.size(), room));
}

void Open(const CommandRow&, int, char** words) {
    const int rmid = DecodeNumber(words[1]);
    const size_t size = std::strlen(words[2]) + kRoomForPassword;
    const Memory<char> info(static_cast<char*>(GetMem(size)));
    if (!info) return Message(kError, "Error allocating memory for info string\n");
    std::strcpy(info.get(), words[2]);
    if (replace_password) InsertPassword(info.get(), size);
    const int rc = Call(&xa_switch_t::xa_open_entry, info.get(), rmid, DecodeFlags(words[3]));
    Report("XA Open", rmid, rc, rc != XA_OK);
}

void Close(const CommandRow&, int, char** words) {
    const int rmid = DecodeNumber(words[1]);
    const int rc = Call(&xa_switch_t::xa_close_entry, nullptr, rmid, DecodeFlags(words[2]));
    Report("XA Close", rmid, rc, rc != XA_OK);
}

// --- Recovery --------------------------------------------------------------------------------------------------------

void AddFormat(Line& line, int index, sb4 format) {
    line.Format("XID[%d]: FormatID:   %X ( ", index, static_cast<unsigned>(format));
    for (int shift = 24; shift >= 0; shift -= 8) {
        const auto byte = static_cast<unsigned char>(static_cast<ub4>(format) >> shift);
        if (byte >= 33 && byte <= 126) line.Character(static_cast<char>(byte));
    }
    line.Text(" )\n");
}

// Bytes [first, last) of the data. They come in pairs, as their places in the whole area have it.
void AddBytes(Line& line, const char* label, const XID& xid, sb4 first, sb4 last) {
    line.Text(label);
    for (sb4 place = first; place < last; ++place) {
        if (place > first && place % 2 == 0) line.Character(' ');
        line.Hex(xid.data + place, 1);
    }
}

void PrintXid(int index, const XID& xid) {
    const sb4 global = std::clamp(xid.gtrid_length, 0, XIDDATASIZE);
    const sb4 branch = std::clamp(xid.bqual_length, 0, XIDDATASIZE - global);
    Line line;
    AddFormat(line, index, xid.formatID);
    line.Format("        Gtrid Len:  %d\n        Bqual Len:  %d\n", xid.gtrid_length, xid.bqual_length);
    AddBytes(line, "        Gtrid Data: ", xid, 0, global);
    AddBytes(line, "\n        Bqual Data: ", xid, global, global + branch);
    line.Text("\n\n").Print();
}

void Recover(const CommandRow&, int, char** words) {
    constexpr int kMost = 20;
    XID found[kMost] = {};
    const int rmid = DecodeNumber(words[1]);
    const int rc = Call(&xa_switch_t::xa_recover_entry, found, kMost, rmid, DecodeFlags(words[2]));
    Report("XA Recover", rmid, rc, rc < 0);
    if (rc < 0) return;
    Message(kOutput, "\nNumber of Entries Returned: %d\n", rc);
    for (int index = 0; index < std::min(rc, kMost); ++index) PrintXid(index, found[index]);
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::xaopen, Words(4), "Usage: xaopen <rmid> <info string> <xaflags>"}, Open},
    {{Code::xaclose, Words(3), "Usage: xaclose <rmid> <xaflags>"}, Close},
    {{Code::xarecover, Words(3), "Usage: xarecover <rmid> <xaflags>"}, Recover},
};

}  // namespace

void AddXaCommands(HandlerTable& handlers) {
    handlers.Add<RunBranchCall>(kBranchCalls);
    handlers.Add(kPlainCommands);
}
