// Binds and defines. No address is ever typed: value, indicator, length, return code and current element are those of
// the buffer or the struct member that a word names. Command thread only.
#include <algorithm>
#include <optional>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "objects/buffers.h"
#include "objects/structs.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

// Enters a bind or define under the statement that words[1] names. A name that is taken is entered anew.
template <class T> void EnterOnStatement(Kind kind, const NewObject<T>& object, char** words) {
    object.EnterAnew(kind, ParentOf(Kind::stmt, words[1]));
}

// --- Binds -----------------------------------------------------------------------------------------------------------

// What is bound: a name or a position. Of a struct, a position stands for one of its members, too.
struct Placeholder {
    TextArgument name;
    ub4 position = 0;
    long member = 0;
};

struct BindArguments {
    OCIStmt* statement;
    OCIError* error;
    DataTarget target;
    ub4 most_elements;
    ub4* current;
    ub4 mode;
};

// A form of a line: its word count, and where the words behind the placeholder stand.
struct BindForm {
    int count;
    int data;
    std::optional<int> member;  // of a struct; without the word, the placeholder tells the member
    int most_elements;
    std::optional<int> current;
    int mode;
};

struct Bind : CommandRow {
    bool (*read)(Placeholder& placeholder, char** words);  // false when the command ends here, which has been said
    sword (*call)(OCIBind** place, const Placeholder& placeholder, const BindArguments& bind);
    BindForm forms[2];  // one for each word count

    const BindForm& FormOf(int count) const { return *std::ranges::find(forms, count, &BindForm::count); }
};

// Whether the dispatcher lets through just the counts that the forms are for.
constexpr bool FormsMatchCounts(const Bind& bind) {
    return bind.words.bits == Words(bind.forms[0].count, bind.forms[1].count).bits && !bind.words.from_there_on;
}

bool ReadName(Placeholder& placeholder, char** words) {
    return placeholder.name.SetWords(words + 4, TextArea::four_times_and_one);
}

bool ReadPosition(Placeholder& placeholder, char** words) {
    placeholder.position = static_cast<ub4>(DecodeNumber(words[4]));
    placeholder.member = DecodeNumber(words[4]) - 1L;
    return true;
}

sword BindByName(OCIBind** place, const Placeholder& placeholder, const BindArguments& bind) {
    const DataTarget& target = bind.target;
    return Call(&ClientLibrary::OCIBindByName, bind.statement, place, bind.error, placeholder.name.Text(),
                static_cast<sb4>(placeholder.name.Length()), target.value, static_cast<sb4>(target.size), target.type,
                target.indicator, target.length, target.return_code, bind.most_elements, bind.current, bind.mode);
}

sword BindByPosition(OCIBind** place, const Placeholder& placeholder, const BindArguments& bind) {
    const DataTarget& target = bind.target;
    return Call(&ClientLibrary::OCIBindByPos, bind.statement, place, bind.error, placeholder.position, target.value,
                static_cast<sb4>(target.size), target.type, target.indicator, target.length, target.return_code,
                bind.most_elements, bind.current, bind.mode);
}

// "null" passes no current element; another word is stored in the field that is passed. In a form without the word the
// field of a buffer is passed as it is.
ub4* CurrentElement(const BindForm& form, char** words, const DataTarget& target) {
    if (!form.current) return FindBufferQuietly(words[form.data]) == nullptr ? nullptr : target.current_element;
    if (IsNull(words[*form.current])) return nullptr;
    *target.current_element = DecodeCount(words[*form.current]);
    return target.current_element;
}

void RunBind(const Bind& row, int count, char** words) {
    const BindForm& form = row.FormOf(count);
    CheckInUse(Kind::bind, words[2]);  // a warning, no more
    NewObject<OCIBind> object(words[2]);
    BindArguments bind{};
    bind.statement = Resolve<OCIStmt>(Kind::stmt, words[1]);
    bind.error = ResolveError<OCIError>(words[3]);
    Placeholder placeholder;
    if (!row.read(placeholder, words)) return;
    const long member = form.member ? DecodeLong(words[*form.member]) : placeholder.member;
    if (!FindDataTarget(words[form.data], member, bind.target)) return;
    bind.most_elements = DecodeCount(words[form.most_elements]);
    bind.current = CurrentElement(form, words, bind.target);
    bind.mode = DecodeStatementMode(words[form.mode], BindModeKeywords);
    const sword rc = row.call(object.Place(), placeholder, bind);
    TraceAndReport(row.code, words[1], bind.error, rc);
    if (rc == OCI_SUCCESS && object.Place() != nullptr)
        EnterOnStatement(Kind::bind, object, words);
}

constexpr Bind kBinds[] = {
    {{Code::ocibindbyname, Words(10, 11),
      "OCIBindByName hStmt hBind hError placeholder placeholder_len {memhandle | memstructhandle elementindex} "
      "maxarr_len curelep mode"},
     ReadName, BindByName,
     {{.count = 10, .data = 6, .member = {}, .most_elements = 7, .current = 8, .mode = 9},
      {.count = 11, .data = 6, .member = 7, .most_elements = 8, .current = 9, .mode = 10}}},
    {{Code::ocibindbypos, Words(8, 9),
      "OCIBindByPos hStmt hBind hError pos {memhandle | memstructhandle} maxarr_len [curelep] mode"},
     ReadPosition, BindByPosition,
     {{.count = 8, .data = 5, .member = {}, .most_elements = 6, .current = {}, .mode = 7},
      {.count = 9, .data = 5, .member = {}, .most_elements = 6, .current = 7, .mode = 8}}},
};
static_assert(std::ranges::all_of(kBinds, FormsMatchCounts));

// --- Defines ---------------------------------------------------------------------------------------------------------

// A name that is taken hands its define over, and keeps it.
void DefineByPosition(const CommandRow& row, int, char** words) {
    const NamedObject* const held = FindByName(Kind::define, words[2]);
    NewObject<OCIDefine> object(words[2]);
    if (held != nullptr) object.Hand(static_cast<OCIDefine*>(held->object));
    auto* const statement = Resolve<OCIStmt>(Kind::stmt, words[1]);
    auto* const error = ResolveError<OCIError>(words[3]);
    const int position = DecodeNumber(words[4]);
    DataTarget target;
    if (!FindDataTarget(words[5], position - 1L, target)) return;
    const ub4 mode = DecodeStatementMode(words[6], DefineModeKeywords);
    const sword rc = Call(&ClientLibrary::OCIDefineByPos, statement, object.Place(), error, static_cast<ub4>(position),
                          target.value, static_cast<sb4>(target.size), target.type, target.indicator, target.length,
                          target.return_code, mode);
    TraceAndReport(row.code, words[1], error, rc);
    if (rc != OCI_SUCCESS || held != nullptr || object.Place() == nullptr) return;
    EnterOnStatement(Kind::define, object, words);
}

constexpr PlainCommand kDefines[] = {
    {{Code::ocidefinebypos, Words(7), "OCIDefineByPos Stmt hDefine hError pos {memhandle | memstructhandle} mode"},
     DefineByPosition},
};

// --- Arrays of structs -----------------------------------------------------------------------------------------------

template <class Object> struct ArrayOfStruct : CommandRow {
    LibraryFunction<sword(Object*, OCIError*, ub4, ub4, ub4, ub4)> ClientLibrary::*function;
    Kind kind;
};

// A row holds each member's value, indicator, length and return code, so all four lie a row apart.
template <class Object> void SetArrayOfStruct(const ArrayOfStruct<Object>& row, int, char** words) {
    auto* const object = Resolve<Object>(row.kind, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const MemStruct* const record = FindStruct(words[3]);
    if (record == nullptr) return;
    const ub4 skip = record->row_size;
    const sword rc = Call(row.function, object, error, skip, skip, skip, skip);
    TraceAndReport(row.code, words[1], error, rc);
}

constexpr ArrayOfStruct<OCIBind> kBindArrays[] = {
    {{Code::ocibindarrayofstruct, Words(4), "OCIBindArrayOfStruct hBind hError memstructhandle"},
     &ClientLibrary::OCIBindArrayOfStruct, Kind::bind},
};
constexpr ArrayOfStruct<OCIDefine> kDefineArrays[] = {
    {{Code::ocidefinearrayofstruct, Words(4), "OCIDefineArrayOfStruct hDefine hError memstructhandle"},
     &ClientLibrary::OCIDefineArrayOfStruct, Kind::define},
};

}  // namespace

void AddBindCommands(HandlerTable& handlers) {
    handlers.Add<RunBind>(kBinds);
    handlers.Add(kDefines);
    handlers.Add<SetArrayOfStruct<OCIBind>>(kBindArrays);
    handlers.Add<SetArrayOfStruct<OCIDefine>>(kDefineArrays);
}
