// Calls on a login or a cursor that is there, and the listing of an area's fields. Command thread only.
#include "commands/families.h"
#include "commands/legacy/area_words.h"
#include "core/messages.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

// What a call may leave to do, besides its trace line and its report.
enum class After { nothing, releases, shows_rows };

struct AreaCall : CommandRow {
    Kind kind;
    sword (*call)(Cda_Def* area, char** words);
    After after = After::nothing;
};

void ShowRows(const AreaArgument& cursor, sword rc) {
    constexpr sword kNoMoreRows = 1403;
    if (cursor.slot != nullptr && (rc == OCI_SUCCESS || rc == kNoMoreRows))
        Message(kOutput, "Rows processed - %ld\n", static_cast<long>(cursor.slot->area->rpc));
}

void RunAreaCall(const AreaCall& row, int, char** words) {
    const AreaArgument area = ResolveArea(row.kind, words[1]);
    const sword rc = row.call(area.area, words);
    TraceAndReportAreas(row.code, words[1], row.kind == Kind::cursor ? CalledCursor(area) : CalledLogin(area), rc);
    if (row.after == After::shows_rows) ShowRows(area, rc);
    if (row.after == After::releases && rc == OCI_SUCCESS && area.slot != nullptr) ReleaseArea(*area.slot);
}

template <auto kFunction> sword OnArea(Cda_Def* area, char**) {
    return Call(kFunction, area);
}

constexpr AreaCall kLoginCalls[] = {
    {{Code::ologof, Words(2), "ologof lda"}, Kind::ldainfo, OnArea<&ClientLibrary::ologof>, After::releases},
    {{Code::ocom, Words(2), "ocom lda"}, Kind::ldainfo, OnArea<&ClientLibrary::ocom>},
    {{Code::orol, Words(2), "orol lda"}, Kind::ldainfo, OnArea<&ClientLibrary::orol>},
    {{Code::ocon, Words(2), "ocon lda"}, Kind::ldainfo, OnArea<&ClientLibrary::ocon>},
    {{Code::ocof, Words(2), "ocof lda"}, Kind::ldainfo, OnArea<&ClientLibrary::ocof>},
    {{Code::obreak, Words(2), "obreak lda"}, Kind::ldainfo, OnArea<&ClientLibrary::obreak>},
    {{Code::onbset, Words(2), "onbset lda"}, Kind::ldainfo, OnArea<&ClientLibrary::onbset>},
    {{Code::onbclr, Words(2), "onbclr lda"}, Kind::ldainfo, OnArea<&ClientLibrary::onbclr>},
    {{Code::onbtst, Words(2), "onbtst lda"}, Kind::ldainfo, OnArea<&ClientLibrary::onbtst>},
};

constexpr AreaCall kCursorCalls[] = {
    {{Code::oclose, Words(2), "oclose cda"}, Kind::cursor, OnArea<&ClientLibrary::oclose>, After::releases},
    {{Code::ocan, Words(2), "ocan cda"}, Kind::cursor, OnArea<&ClientLibrary::ocan>},
    {{Code::oexec, Words(2), "oexec cda"}, Kind::cursor, OnArea<&ClientLibrary::oexec>, After::shows_rows},
    {{Code::ofetch, Words(2), "ofetch cda"}, Kind::cursor, OnArea<&ClientLibrary::ofetch>, After::shows_rows},
    {{Code::ofen, Words(3), "ofen cda nrows"}, Kind::cursor,
     [](Cda_Def* cursor, char** words) { return Call(&ClientLibrary::ofen, cursor, DecodeNumber(words[2])); },
     After::shows_rows},
    {{Code::oexn, Words(4), "oexn cda iters rowoff"}, Kind::cursor,
     [](Cda_Def* cursor, char** words) {
         return Call(&ClientLibrary::oexn, cursor, DecodeNumber(words[2]), DecodeNumber(words[3]));
     },
     After::shows_rows},
    {{Code::oexfet, Words(5), "oexfet cda nrows cancel exact"}, Kind::cursor,
     [](Cda_Def* cursor, char** words) {
         return Call(&ClientLibrary::oexfet, cursor, DecodeCount(words[2]), DecodeNumber(words[3]),
                     DecodeNumber(words[4]));
     },
     After::shows_rows},
    {{Code::oopt, Words(4), "oopt cda rbopt waitopt"}, Kind::cursor,
     [](Cda_Def* cursor, char** words) {
         return Call(&ClientLibrary::oopt, cursor, DecodeNumber(words[2]), DecodeNumber(words[3]));
     }},
};

void Parse(const CommandRow& row, int, char** words) {
    const AreaArgument cursor = ResolveArea(Kind::cursor, words[1]);
    TextArgument sql;
    if (!SetAreaText(sql, words + 2)) return;
    const sword rc = Call(&ClientLibrary::oparse, cursor.area, sql.Text(), LengthOfText(sql), DecodeNumber(words[4]),
                          DecodeCount(words[5]));
    TraceAndReportAreas(row.code, words[1], CalledCursor(cursor), rc);
}

// Calls nothing. A name is a cursor's, else a login's.
void ShowArea(const CommandRow& row, int, char** words) {
    const NamedArea* slot = FindSlot(Areas(Kind::cursor), words[1]);
    if (slot == nullptr) slot = ResolveArea(Kind::ldainfo, words[1]).slot;
    outputOCI(row.code, OCI_SUCCESS, words[1]);
    if (slot == nullptr) return;
    const Cda_Def& area = *slot->area;
    const struct { const char* name; long value; } fields[] = {
        {"v2_rc", area.v2_rc}, {"ft", area.ft}, {"rpc", area.rpc}, {"peo", area.peo},
        {"fc", area.fc}, {"rc", area.rc}, {"wrn", area.wrn},
    };
    for (const auto& field : fields) Message(kOutput, "%s=%ld\n", field.name, field.value);
    Message(kOutput, "rid=%08lX.%04lX.%04lX\n", static_cast<unsigned long>(area.rid.rcs7),
            static_cast<unsigned long>(area.rid.rcs8), static_cast<unsigned long>(area.rid.rd.rcs5));
    Message(kOutput, "ose=%ld\n", static_cast<long>(area.ose));
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::oparse, Words(6), "oparse cda stmttext stmttext_len deferred language"}, Parse},
    {{Code::getcda, Words(2), "getcda cda"}, ShowArea},
};

}  // namespace

void AddLegacyAreaCommands(HandlerTable& handlers) {
    handlers.Add<RunAreaCall>(kLoginCalls);
    handlers.Add<RunAreaCall>(kCursorCalls);
    handlers.Add(kPlainCommands);
}
