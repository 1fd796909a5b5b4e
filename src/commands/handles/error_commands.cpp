// Retrieving diagnostic records by hand, and switching the report of return codes. Command thread only.
#include <algorithm>
#include <string>
#include <vector>

#include "commands/families.h"
#include "core/keywords.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "oci.h"
#include "platform/client_library.h"
#include "report/diagnostics.h"
#include "report/trace.h"

namespace {

void* ResolveDiagnosticHandle(int type, const char* name) {
    switch (type) {
        case OCI_HTYPE_ERROR: return ResolveError<void>(name);
        case OCI_HTYPE_ENV: return Resolve<void>(Kind::environment, name);
        default: Message(kOutput, "Invalid handle type\n"); return nullptr;
    }
}

// What one record is read into. A script may leave out any of the three.
struct Diagnostic {
    char state[32] = {};
    sb4 code = 0;
    std::vector<char> text;
    bool has_state = true, has_code = true, has_text = true;

    // The library is told the size that the script has typed. The room is larger where that is beyond what a text
    // needs.
    explicit Diagnostic(int typed_size) : text(Room(typed_size)) {}
    static size_t Room(int typed_size) {
        constexpr int kLongestText = 1 << 20;
        if (typed_size < 0) return kLongestText;
        return static_cast<size_t>(std::clamp<int>(typed_size, kDiagnosticSize, kLongestText));
    }
    void Print() const;

private:
    bool PrintState() const;
};

// False after a failed conversion, which has been printed.
bool Diagnostic::PrintState() const {
    constexpr size_t kStateLength = 5;
    std::string shown(state, kStateLength);
    if (Utf16Mode && !convertFromUTF16(state, 2 * kStateLength, shown)) return false;
    shown.resize(kStateLength);
    Line line;
    line.Text("SQLState: ").Text(Utf16Mode ? "W\"" : "").Text(shown).Text(Utf16Mode ? "\"\n" : "\n").Print();
    return true;
}

void Diagnostic::Print() const {
    if (has_state && !PrintState()) return;
    if (has_code) Message(kOutput, "SQLCode: %ld\n", static_cast<long>(code));
    std::string shown;
    if (!has_text || !ReadDiagnostic(text.data(), text.size(), shown)) return;
    Message(kOutput, Utf16Mode ? "Message: W\"%s\"\n" : "Message: %s\n", shown.c_str());
}

void GetError(const CommandRow& row, int count, char** words) {
    const int type = DecodeKeyword(words[4], HandleTypeKeywords);
    void* handle = ResolveDiagnosticHandle(type, words[1]);
    const auto number = static_cast<ub4>(DecodeNumber(words[2]));
    const int size = DecodeNumber(words[3]);
    Diagnostic record(size);
    if (count == 8) {
        record.has_state = !IsNull(words[5]);
        record.has_code = !IsNull(words[6]);
        record.has_text = !IsNull(words[7]);
    }
    const sword rc = Call(&ClientLibrary::OCIErrorGet, handle, number,
                          record.has_state ? reinterpret_cast<OraText*>(record.state) : nullptr,
                          record.has_code ? &record.code : nullptr,
                          record.has_text ? reinterpret_cast<OraText*>(record.text.data()) : nullptr,
                          static_cast<ub4>(size), static_cast<ub4>(type));
    outputOCI(row.code, rc, words[1]);
    if (rc == OCI_SUCCESS || rc == OCI_SUCCESS_WITH_INFO) record.Print();
}

void SetCallError(const CommandRow&, int, char** words) {
    report_switch = DecodeNumber(words[1]);
    Message(kOutput, "SetCallErrorOCI set to %ld\n", static_cast<long>(report_switch));
}

constexpr PlainCommand kErrorCommands[] = {
    {{Code::ocierrorget, Words(5, 8),
      "OCIErrorGet hHandle index cbErrorMsg handletype [sqlstate nativeerror message]"}, GetError},
    {{Code::setcallerroroci, Words(2), "SetCallErrorOCI {0|1}"}, SetCallError},
};

}  // namespace

void AddErrorCommands(HandlerTable& handlers) {
    handlers.Add(kErrorCommands);
}
