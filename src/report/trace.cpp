// The trace lines of all commands, made from their list. Any thread.
#include "report/trace.h"

#include "core/messages.h"
#include "report/return_code.h"

namespace {

// How a line goes on after the function's name. The texts are what scripts' logs have always held: the rowid label
// lacks a blank, one function's name is doubled, two lines are not ended.
enum class Ending { name, name_and_rc, rc, plain, unended };

struct Label {
    const char* text;  // what stands between the name and the object
    Ending ending;
};

// As commands.def names them.
namespace labels {
constexpr Label henv = {"OCI henv = ", Ending::name};
constexpr Label hsvc = {"OCI hSvc = ", Ending::name};
constexpr Label handle = {"OCI handle = ", Ending::name};
constexpr Label hserver = {"OCI hServer = ", Ending::name};
constexpr Label hstring = {"OCI hString = ", Ending::name};
constexpr Label hraw = {"OCI hRaw = ", Ending::name};
constexpr Label hfile = {"OCI hFile = ", Ending::name};
constexpr Label hlob = {"OCI hLob = ", Ending::name};
constexpr Label hstmt = {"OCI hStmt = ", Ending::name};
constexpr Label hdefine = {"OCI hDefine = ", Ending::name};
constexpr Label hbind = {"OCI hBind = ", Ending::name};
constexpr Label memhandle = {"memhandle = ", Ending::name};
constexpr Label hresult = {"OCI hResult = ", Ending::name};
constexpr Label hndlp = {"OCI hndlp = ", Ending::name};
constexpr Label oci_svchp = {"OCI svchp = ", Ending::name};
constexpr Label hrowid = {"OCI hRowid= ", Ending::name};
constexpr Label mutex = {"mutex = ", Ending::name};
constexpr Label key = {"key = ", Ending::name};
constexpr Label tid = {"tid = ", Ending::name};
constexpr Label thnd = {"thnd = ", Ending::name};
constexpr Label envhp = {"envhp = ", Ending::name};
constexpr Label spoolhd = {"spoolhd = ", Ending::name};
constexpr Label poolhd = {"poolhd = ", Ending::name};
constexpr Label lda = {"lda = ", Ending::name};
constexpr Label svchp = {"svchp = ", Ending::name};
constexpr Label cda = {"cda = ", Ending::name};
constexpr Label lda_rc = {"lda = ", Ending::name_and_rc};
constexpr Label cda_rc = {"cda = ", Ending::name_and_rc};
constexpr Label cursor_rc = {"cursor = ", Ending::name_and_rc};
constexpr Label rc = {"rc = ", Ending::rc};
constexpr Label plain = {"", Ending::plain};
constexpr Label unended = {"", Ending::unended};
}  // namespace labels

struct TraceRow {
    Code code;
    const char* function;
    const Label& label;
};

constexpr TraceRow kTraceRows[] = {
#define CALL(word, code, function, label) {Code::word, #function, labels::label},
#include "core/commands.def"
};

// Row of each code, for one step from a code to its line; null where a code has none.
struct TraceIndex {
    const TraceRow* rows[kHighestCommandCode + 1] = {};
    constexpr TraceIndex() {
        for (const TraceRow& row : kTraceRows) rows[static_cast<int>(row.code)] = &row;
    }
};
constexpr TraceIndex kTraceIndex;

const TraceRow* FindTraceRow(Code code) {
    const int place = static_cast<int>(code);
    return place < 0 || place > kHighestCommandCode ? nullptr : kTraceIndex.rows[place];
}

}  // namespace

void outputOCI(Code code, long rc, const char* name) {
    constexpr char kGap[] = "             ";  // 13 blanks
    const TraceRow* row = FindTraceRow(code);
    if (row == nullptr) return Message(kError, "outputOCI (): unrecognized command!\n");
    if (name == nullptr) name = "";
    const char* label = row->label.text;
    switch (row->label.ending) {
        case Ending::name: return Message(kOutput, "%s%s%s%s\n", row->function, kGap, label, name);
        case Ending::name_and_rc:
            return Message(kOutput, "%s%s%s%s, rc = %ld\n", row->function, kGap, label, name, rc);
        case Ending::rc: return Message(kOutput, "%s%s%s%ld\n", row->function, kGap, label, rc);
        case Ending::plain: return Message(kOutput, "%s\n", row->function);
        case Ending::unended: return Message(kOutput, "%s", row->function);
    }
}

void TraceAndReport(Code code, const char* name, void* error_handle, int rc) {
    outputOCI(code, rc, name);
    ReturnCodeReport(error_handle, rc);
}
