// The probe library: exports the whole call interface, records each call with its arguments, and answers as a test
// tells it. A test of the driver reads in the log what the library was really called with.
//
// A call is recorded as one line, "    probe: OCIPing(h3, h2, 0) = 0", on standard output, in order with the driver's
// own text, or at the end of the file that PROBE_LOG names. A pointer reads as "null", as the name of what the probe
// handed out ("h1", "h2", ... in the order of making), as a quoted text where a text and its length follow each other
// or where the text is terminated, as the parts of an XID, or as "pointer".
//
// PROBE_ANSWERS names a file of answers, a line each: FUNCTION RESULT followed by any number of
//
//   POSITION[+OFFSET]=TYPE:VALUE   what stands at POSITION, counted from 1, is an output to fill, OFFSET bytes behind its
//                                  beginning: TYPE is i1, i2, i4, i8 for integers by width, f8 for a double, t for a
//                                  terminated text, b for bytes in hexadecimal, p and x for a pointer to such a text and
//                                  such bytes, h for a pointer to a new object or, with a number, to that one, w for
//                                  a text where the pointer there leads, c for the context last given for pieces
//   POSITION?TYPE                  records what stands at POSITION: i1 to i8; tN, N characters; p, the text or texts
//                                  that pointers there lead to, up to a null pointer
//   call:KIND:ARGUMENT...          calls what the driver has installed and records what it gave (CallBack says how)
//
// Answers for a function are used in order, the last one again and again; behind a line "in turns", the first one comes
// again behind the last. FUNCTION@NUMBER:NUMBER...,... has the answers of calls whose integers are these or the ones behind
// the comma; * stands for functions without any of their own. Without any answer the result is 0. A result of 0
// hands out a new object through the first pointer to a pointer; of a function that returns a pointer, 0 is null and
// anything else a new object.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <fstream>
#include <map>
#include <mutex>
#include <sstream>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "oci.h"
#include "kelpci.h"

namespace {

struct Output { size_t position, offset; std::string type, value; };

struct Answer {
    long long result = 0;
    std::vector<Output> outputs;
    std::vector<Output> shown;  // of which the type alone counts
    std::vector<std::vector<std::string>> callbacks;
};

// Callbacks of the driver, the last of each kind, and their contexts.
struct Installed {
    void *in_context = nullptr, *out_context = nullptr, *define_context = nullptr, *lob_context = nullptr,
         *piece_context = nullptr;
    OCICallbackInBind in = nullptr;
    OCICallbackOutBind out = nullptr;
    OCICallbackDefine define = nullptr;
    OCICallbackLobRead read = nullptr;
    OCICallbackLobWrite write = nullptr;
    OCIThreadStartFunction start = nullptr;
    void* started_with = nullptr;
};

// One argument as the call passed it.
struct Argument {
    enum Form { integer, pointer, text, terminated, xid, place } form;    // place: a pointer to a pointer
    long long number;
    const void* address;
};

struct State {
    std::recursive_mutex mutex;    // a routine that is called back calls, too
    std::map<std::string, std::deque<Answer>> answers;
    bool in_turns = false;
    std::map<const void*, size_t> objects;
    std::deque<std::vector<char>> memory;
    Installed installed;
    std::FILE* log = nullptr;    // null: standard output
};

std::vector<std::string> Split(const std::string& text) {
    std::vector<std::string> parts;
    std::istringstream rest(text);
    for (std::string part; std::getline(rest, part, ':');) parts.push_back(part);
    return parts;
}

Answer ReadAnswer(std::istringstream& words) {
    Answer answer;
    words >> answer.result;
    for (std::string word; words >> word;) {
        if (word.starts_with("call:")) {
            answer.callbacks.push_back(Split(word.substr(5)));
            continue;
        }
        if (const size_t mark = word.find('?'); mark != std::string::npos && word.find('=') == std::string::npos) {
            answer.shown.push_back({std::stoul(word), 0, word.substr(mark + 1), ""});
            continue;
        }
        const size_t equals = word.find('=');
        const size_t colon = word.find(':', equals);
        if (colon == std::string::npos) {
            std::fprintf(stderr, "probe: cannot read answer %s\n", word.c_str());
            std::abort();
        }
        const size_t plus = word.find('+');
        const size_t offset = plus < equals ? std::stoul(word.substr(plus + 1)) : 0;
        const std::string type = word.substr(equals + 1, colon - equals - 1);
        answer.outputs.push_back({std::stoul(word), offset, type, word.substr(colon + 1)});
    }
    return answer;
}

void AddAnswer(State& state, const std::string& function, const Answer& answer) {
    const size_t at = std::min(function.find('@'), function.size());
    std::istringstream integers(function.substr(at));
    if (at == function.size()) state.answers[function].push_back(answer);
    for (std::string text; std::getline(integers, text, ',');)
        state.answers[function.substr(0, at + 1) + text.substr(text[0] == '@')].push_back(answer);
}

State* MakeState() {
    auto* state = new State;
    if (const char* log = std::getenv("PROBE_LOG")) state->log = std::fopen(log, "a");
    if (const char* file = std::getenv("PROBE_ANSWERS")) {
        std::ifstream lines(file);
        for (std::string line; std::getline(lines, line);) {
            std::istringstream words(line);
            std::string function;
            if (!(words >> function) || function[0] == '#') continue;
            if (function == "in") state->in_turns = true;
            else AddAnswer(*state, function, ReadAnswer(words));
        }
    }
    return state;
}

// Never destroyed: the driver may call until it ends.
State& TheState() {
    static State* state = MakeState();
    return *state;
}

Answer NextAnswer(State& state, const std::string& function, const std::vector<Argument>& arguments) {
    std::string integers;
    for (const Argument& argument : arguments)
        if (argument.form == Argument::integer) integers += (integers.empty() ? "@" : ":") + std::to_string(argument.number);
    auto found = state.answers.find(function + integers);
    if (found == state.answers.end()) found = state.answers.find(function);
    if (found == state.answers.end()) found = state.answers.find("*");
    if (found == state.answers.end()) return {};
    std::deque<Answer>& answers = found->second;
    const Answer answer = answers.front();
    if (state.in_turns) answers.push_back(answer);
    if (answers.size() > 1) answers.pop_front();
    return answer;
}

void AppendText(std::string& line, const void* text, long long length) {
    constexpr long long kShown = 64;
    const auto* bytes = static_cast<const unsigned char*>(text);
    line += '"';
    for (long long index = 0; index < std::min(length, kShown); ++index) {
        char hexadecimal[5];
        std::snprintf(hexadecimal, sizeof hexadecimal, "\\x%02X", bytes[index]);
        if (bytes[index] >= ' ' && bytes[index] < 127) line += static_cast<char>(bytes[index]);
        else line += hexadecimal;
    }
    line += '"';
}

void AppendXid(std::string& line, const XID& xid) {
    line += std::to_string(xid.formatID) + ":";
    AppendText(line, xid.data, std::clamp(xid.gtrid_length, 0, XIDDATASIZE));
    line += ":";
    const sb4 start = std::clamp(xid.gtrid_length, 0, XIDDATASIZE);
    AppendText(line, xid.data + start, std::clamp(xid.bqual_length, 0, XIDDATASIZE - start));
}

void AppendArgument(State& state, std::string& line, const Argument& argument, const Argument* next) {
    if (argument.form == Argument::integer) {
        line += std::to_string(argument.number);
    } else if (!argument.address) {
        line += "null";
    } else if (const auto object = state.objects.find(argument.address); object != state.objects.end()) {
        line += "h" + std::to_string(object->second);
    } else if (argument.form == Argument::text && next && next->form == Argument::integer) {
        AppendText(line, argument.address, next->number);
    } else if (argument.form == Argument::terminated) {
        const std::string_view whole = static_cast<const char*>(argument.address);
        AppendText(line, whole.data(), static_cast<long long>(whole.size()));
    } else if (argument.form == Argument::xid) {
        AppendXid(line, *static_cast<const XID*>(argument.address));
    } else {
        line += "pointer";
    }
}

void Print(State& state, const std::string& line) {
    std::FILE* const log = state.log ? state.log : stdout;
    std::fputs(line.c_str(), log);
    std::fflush(log);
}

template <class Value>
void Store(const void* place, Value value) {
    std::memcpy(const_cast<void*>(place), &value, sizeof value);
}

void Record(State& state, const char* function, const std::vector<Argument>& arguments, long long result) {
    std::string line = std::string("    probe: ") + function + "(";
    for (size_t index = 0; index < arguments.size(); ++index) {
        if (index > 0) line += ", ";
        AppendArgument(state, line, arguments[index], index + 1 < arguments.size() ? &arguments[index + 1] : nullptr);
    }
    line += ") = " + std::to_string(result) + "\n";
    Print(state, line);
}

template <class Value> Value Load(const void* place) {
    Value value;
    std::memcpy(&value, place, sizeof value);
    return value;
}

// What an argument points to, as a test asked for it.
void Show(State& state, const Output& shown, const std::vector<Argument>& arguments) {
    const void* const place = arguments.at(shown.position - 1).address;
    std::string line = "    probe: " + std::to_string(shown.position) + " is ";
    if (!place) line += "null";
    else if (shown.type == "i1") line += std::to_string(Load<signed char>(place));
    else if (shown.type == "i2") line += std::to_string(Load<short>(place));
    else if (shown.type == "i4") line += std::to_string(Load<int>(place));
    else if (shown.type == "i8") line += std::to_string(Load<long long>(place));
    else if (shown.type[0] == 't') AppendText(line, place, std::stoll(shown.type.substr(1)));
    else for (auto* text = static_cast<const char* const*>(place); *text; ++text)
        AppendText(line, *text, static_cast<long long>(std::strlen(*text)));
    Print(state, line + "\n");
}

// --- Callbacks ------------------------------------------------------------------------------------------------------

using Words = std::vector<std::string>;

template <class T = ub4> T Number(const Words& words, size_t index) { return static_cast<T>(std::stoul(words[index])); }

std::string Answered(const std::string& callback, sb4 rc) {
    return "    probe: " + callback + " = " + std::to_string(rc);
}

void AppendPiece(std::string& line, ub1 piece, const void* data, long long length) {
    line += ": piece " + std::to_string(piece) + ", ";
    AppendText(line, data, length);
}

// in:ITERATION:INDEX asks for a value to bind.
void CallIn(State& state, const Words& words) {
    const Installed& installed = state.installed;
    void *data = nullptr, *indicator = nullptr;
    ub4 length = 0;
    ub1 piece = 0;
    const sb4 rc = installed.in(installed.in_context, nullptr, Number(words, 1), Number(words, 2), &data, &length,
                                &piece, &indicator);
    std::string line = Answered("in callback " + words[1] + ", " + words[2], rc);
    if (rc == OCI_CONTINUE) {
        AppendPiece(line, piece, data, data ? length : 0);
        if (indicator) line += ", indicator " + std::to_string(Load<short>(indicator));
    }
    Print(state, line + "\n");
}

// out:ITERATION:INDEX:PIECE:TEXT delivers a piece to a bind, define:ITERATION:PIECE:TEXT one to a define: the text
// is put in the place that the callback gives, as far as it fits.
void CallOut(State& state, const Words& words) {
    const Installed& installed = state.installed;
    void *data = nullptr, *indicator = nullptr;
    ub4* length = nullptr;
    ub2* code = nullptr;
    const bool is_define = words[0] == "define";
    const std::string& text = words[is_define ? 3 : 4];
    const auto iteration = Number(words, 1);
    auto piece = Number<ub1>(words, is_define ? 2 : 3);
    const sb4 rc = is_define ? installed.define(installed.define_context, nullptr, iteration, &data, &length, &piece,
                                                &indicator, &code)
                             : installed.out(installed.out_context, nullptr, iteration, Number(words, 2), &data,
                                             &length, &piece, &indicator, &code);
    std::string line = Answered(words[0] + " callback " + words[1] + (is_define ? "" : ", " + words[2]), rc);
    if (rc == OCI_CONTINUE && data && length) {
        line += ": piece " + std::to_string(piece) + ", room " + std::to_string(*length);
        *length = std::min(*length, static_cast<ub4>(text.size()));
        std::memcpy(data, text.data(), *length);
        if (indicator) Store(indicator, short{0});
        if (code) *code = 0;
    }
    Print(state, line + "\n");
}

std::string Bytes(const std::string& digits) {
    std::string bytes;
    for (size_t index = 0; index + 1 < digits.size(); index += 2)
        bytes += static_cast<char>(std::stoi(digits.substr(index, 2), nullptr, 16));
    return bytes;
}

// read:PIECE:BYTES delivers a piece of a LOB, read:PIECE one that is not there; write:ROOM asks for one, write:ROOM:TOLD
// and tells of another room, write:0 without any.
void CallRead(State& state, const Words& words) {
    const std::string bytes = words.size() > 2 ? Bytes(words[2]) : "nowhere";
    const sb4 rc = state.installed.read(state.installed.lob_context, words.size() > 2 ? bytes.data() : nullptr,
                                        static_cast<ub4>(bytes.size()), Number<ub1>(words, 1));
    Print(state, Answered("read callback", rc) + "\n");
}

void CallWrite(State& state, const Words& words) {
    std::vector<char> room(Number(words, 1));
    auto length = words.size() > 2 ? Number(words, 2) : static_cast<ub4>(room.size());
    ub1 piece = 255;
    const sb4 rc = state.installed.write(state.installed.lob_context, room.data(), &length, &piece);
    std::string line = Answered("write callback", rc);
    if (rc == OCI_CONTINUE) AppendPiece(line, piece, room.data(), std::min<long long>(length, std::ssize(room)));
    Print(state, line + "\n");
}

void CallBack(State& state, const Words& words) {
    const Installed& installed = state.installed;
    const std::string& kind = words[0];
    if (kind == "in" && installed.in) CallIn(state, words);
    else if ((kind == "out" && installed.out) || (kind == "define" && installed.define)) CallOut(state, words);
    else if (kind == "read" && installed.read) CallRead(state, words);
    else if (kind == "write" && installed.write) CallWrite(state, words);
    else if (kind == "start" && installed.start) installed.start(installed.started_with);
    else Print(state, "    probe: no " + kind + " callback\n");
}

// What calls install. No function but these has such arguments.
template <class... Parameters> void Install(State&, Parameters...) {}
void Install(State& state, OCIBind*, OCIError*, void* in_context, OCICallbackInBind in, void* out_context,
             OCICallbackOutBind out) {
    state.installed.in_context = in_context;
    state.installed.in = in;
    state.installed.out_context = out_context;
    state.installed.out = out;
}
void Install(State& state, OCIDefine*, OCIError*, void* context, OCICallbackDefine define) {
    state.installed.define_context = context;
    state.installed.define = define;
}
void Install(State& state, OCISvcCtx*, OCIError*, OCILobLocator*, ub4*, ub4, void*, ub4, void* context,
             OCICallbackLobRead read, ub2, ub1) {
    state.installed.lob_context = context;
    state.installed.read = read;
}
void Install(State& state, OCISvcCtx*, OCIError*, OCILobLocator*, ub4*, ub4, void*, ub4, ub1,
             void* context, OCICallbackLobWrite write, ub2, ub1) {
    state.installed.lob_context = context;
    state.installed.write = write;
}
void Install(State& state, Cda_Def*, ub1 opcode, sword, ub1* context, sb4, sword, sword, sb2*, text*, sb4, sword, ub2*,
             ub2*, sb4, sb4, sb4, sb4) {
    if (opcode == 0) state.installed.piece_context = context;
}
void Install(State& state, Cda_Def*, ub1 opcode, text*, sb4, ub1* context, sb4, sword, sword, sb2*, ub2*, ub2*, sb4,
             sb4, sb4, sb4, ub4, ub4*, text*, sb4, sword) {
    if (opcode == 0) state.installed.piece_context = context;
}

// A thread's routine: call:start runs it at once, and its calls are recorded behind the one that was given it.
void Install(State& state, void*, OCIError*, OCIThreadStartFunction start, void* with, OCIThreadId*, OCIThreadHandle*) {
    state.installed.start = start;
    state.installed.started_with = with;
}

void* MakeObject(State& state) {
    constexpr size_t kObjectSize = 256;
    state.memory.emplace_back(kObjectSize);
    void* object = state.memory.back().data();
    state.objects.emplace(object, state.objects.size() + 1);
    return object;
}

// The object that records call h and the number.
const void* Object(const State& state, const std::string& number) {
    for (const auto& [object, its_number] : state.objects)
        if (its_number == std::stoul(number)) return object;
    return nullptr;
}

// Pointers that texts are written behind are the caller's, and stay.
void HandOut(State& state, const std::vector<Argument>& arguments, const std::vector<Output>& outputs) {
    for (const Argument& argument : arguments) {
        if (argument.form != Argument::place) continue;
        const auto is_behind = [](const Output& output) { return output.type == "w"; };
        if (!argument.address || std::ranges::any_of(outputs, is_behind)) return;
        *static_cast<void**>(const_cast<void*>(argument.address)) = MakeObject(state);
        return;
    }
}

// A copy that stays where it is.
const char* KeepText(const std::string& text) {
    static auto* const kept = new std::deque<std::string>;
    return kept->emplace_back(text).c_str();
}

void Fill(State& state, const Output& output, const std::vector<Argument>& arguments) {
    if (output.position == 0 || output.position > arguments.size()) return;
    const auto* place = static_cast<const char*>(arguments[output.position - 1].address);
    if (!place) return;
    place += output.offset;
    if (output.type == "i1") Store(place, static_cast<signed char>(std::stoll(output.value)));
    else if (output.type == "i2") Store(place, static_cast<short>(std::stoll(output.value)));
    else if (output.type == "i4") Store(place, static_cast<int>(std::stoll(output.value)));
    else if (output.type == "i8") Store(place, std::stoll(output.value));
    else if (output.type == "f8") Store(place, std::stod(output.value));
    else if (output.type == "p") Store(place, KeepText(output.value));
    else if (output.type == "x") Store(place, KeepText(Bytes(output.value)));
    else if (output.type == "h" && !output.value.empty()) Store(place, Object(state, output.value));
    else if (output.type == "h") Store(place, MakeObject(state));
    else if (output.type == "w") std::strcpy(Load<char*>(place), output.value.c_str());
    else if (output.type == "c") Store(place, state.installed.piece_context);
    else if (output.type == "b") std::memcpy(const_cast<char*>(place), KeepText(Bytes(output.value)), output.value.size() / 2);
    else std::memcpy(const_cast<char*>(place), output.value.c_str(), output.value.size() + 1);
}

template <class T>
Argument Describe(T argument) {
    if constexpr (!std::is_pointer_v<T>) {
        return {Argument::integer, static_cast<long long>(argument), nullptr};
    } else {
        const void* address = reinterpret_cast<const void*>(argument);
        using Target = std::remove_pointer_t<T>;
        if constexpr (std::is_same_v<Target, const OraText>) return {Argument::text, 0, address};
        else if constexpr (std::is_same_v<Target, XID>) return {Argument::xid, 0, address};
        else if constexpr (std::is_same_v<Target, char>) return {Argument::terminated, 0, address};
        else if constexpr (std::is_pointer_v<Target> && !std::is_const_v<std::remove_pointer_t<Target>>)
            return {Argument::place, 0, address};
        else return {Argument::pointer, 0, address};
    }
}

enum Index : size_t {
#define FUNCTION(symbol) kIndexOf##symbol,
#include "platform/client_functions.def"
#undef FUNCTION
    kIndexOfXa
};
const char* const kNames[] = {
#define FUNCTION(symbol) #symbol,
#include "platform/client_functions.def"
#undef FUNCTION
    "xa_open_entry", "xa_close_entry", "xa_start_entry", "xa_end_entry", "xa_rollback_entry", "xa_prepare_entry",
    "xa_commit_entry", "xa_recover_entry", "xa_forget_entry", "xa_complete_entry",
};

// What every exported name leads to: the same function, once for each signature and name.
template <class Signature, size_t kIndex>
struct Entry;
template <class Result, class... Parameters, size_t kIndex>
struct Entry<Result(Parameters...), kIndex> {
    static Result Called(Parameters... parameters) {
        State& state = TheState();
        const std::lock_guard lock(state.mutex);
        std::vector<Argument> arguments{Describe(parameters)...};
        const Answer answer = NextAnswer(state, kNames[kIndex], arguments);
        // An array of XIDs is there to be filled.
        if (sizeof...(Parameters) > 3 && arguments[0].form == Argument::xid) arguments[0].form = Argument::pointer;
        Record(state, kNames[kIndex], arguments, answer.result);
        for (const Output& shown : answer.shown) Show(state, shown, arguments);
        Install(state, parameters...);
        for (const auto& words : answer.callbacks) CallBack(state, words);
        if (answer.result == 0) HandOut(state, arguments, answer.outputs);
        for (const Output& output : answer.outputs) Fill(state, output, arguments);
        if constexpr (std::is_pointer_v<Result>)
            return answer.result ? static_cast<Result>(MakeObject(state)) : nullptr;
        else if constexpr (!std::is_void_v<Result>) return static_cast<Result>(answer.result);
    }
};

// The entry of the XA switch that `member` points at, the `kIndex`th one.
template <auto member, size_t kIndex>
constexpr auto kSwitched =
    &Entry<std::remove_pointer_t<std::remove_reference_t<decltype(std::declval<xa_switch_t>().*member)>>,
           kIndexOfXa + kIndex>::Called;

}  // namespace

// The signatures come from the headers, so the exported symbols are bound to the template's instances by the loader.
#define FUNCTION(symbol)                                                                                        \
    extern "C" __attribute__((used, visibility("hidden"), no_sanitize("address", "thread", "undefined")))       \
    decltype(::symbol)* Resolve##symbol() {                                                                     \
        return &Entry<decltype(::symbol), kIndexOf##symbol>::Called;                                            \
    }                                                                                                           \
    extern "C" __attribute__((ifunc("Resolve" #symbol), visibility("default"))) decltype(::symbol) symbol;
#include "platform/client_functions.def"
#undef FUNCTION

extern "C" { __attribute__((visibility("default"))) xa_switch_t emptyXaSwitch; }    // without any entry
xa_switch_t rmXaSwitch = {
    "probe", TMNOFLAGS, 0,
    kSwitched<&xa_switch_t::xa_open_entry, 0>,     kSwitched<&xa_switch_t::xa_close_entry, 1>,
    kSwitched<&xa_switch_t::xa_start_entry, 2>,    kSwitched<&xa_switch_t::xa_end_entry, 3>,
    kSwitched<&xa_switch_t::xa_rollback_entry, 4>, kSwitched<&xa_switch_t::xa_prepare_entry, 5>,
    kSwitched<&xa_switch_t::xa_commit_entry, 6>,   kSwitched<&xa_switch_t::xa_recover_entry, 7>,
    kSwitched<&xa_switch_t::xa_forget_entry, 8>,   kSwitched<&xa_switch_t::xa_complete_entry, 9>,
};
