// The commands on dates. Command thread only.
#include <algorithm>
#include <cstring>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "commands/values/date_values.h"
#include "core/state.h"
#include "objects/memory.h"

namespace {

using OneDate = ValueOperation<OCIDate, const OCIDate*>;
constexpr OneDate kOneDate[] = {
    {{Code::ocidateassign, WordsBetween(3, 4), "OCIDateAssign hError date [to]"},
     &ClientLibrary::OCIDateAssign},
    {{Code::ocidatelastday, WordsBetween(3, 4), "OCIDateLastDay hError date [last_day]"},
     &ClientLibrary::OCIDateLastDay},
};

using DateAndInt = ValueOperation<OCIDate, const OCIDate*, int>;
constexpr DateAndInt kDateAndInt[] = {
    {{Code::ocidateadddays, WordsBetween(4, 5), "OCIDateAddDays hError date num_days [result]"},
     &ClientLibrary::OCIDateAddDays},
    {{Code::ocidateaddmonths, WordsBetween(4, 5), "OCIDateAddMonths hError date num_months [result]"},
     &ClientLibrary::OCIDateAddMonths},
};

using TwoDates = ValueOperation<int, const OCIDate*, const OCIDate*>;
constexpr TwoDates kTwoDates[] = {
    {{Code::ocidatecompare, WordsBetween(4, 5), "OCIDateCompare hError date1 date2 [result]"},
     &ClientLibrary::OCIDateCompare, Outcome::printed},
    {{Code::ocidatedaysbetween, WordsBetween(4, 5), "OCIDateDaysBetween hError date1 date2 [result]"},
     &ClientLibrary::OCIDateDaysBetween, Outcome::printed},
};

using DateTest = ValueOperation<uword, const OCIDate*>;
constexpr DateTest kDateTests[] = {
    {{Code::ocidatecheck, WordsBetween(3, 4), "OCIDateCheck hError date [valid]"},
     &ClientLibrary::OCIDateCheck},
};

void RunFromText(const CommandRow& row, int count, char** words) {
    OCIError* const error = ResolveError<OCIError>(words[1]);
    TextArgument date;
    TextArgument format;
    TextArgument language;
    if (!SetTextWords(date, words + 2) || !SetTextWords(format, words + 4)) return;
    if (!SetTextWords(language, words + 6)) return;
    ResultPlace<OCIDate> result(count, words, 8);
    const sword rc = Call(&ClientLibrary::OCIDateFromText, error, date.Text(), date.Length(), format.Text(),
                          static_cast<ub1>(format.Length()), language.Text(), language.Length(), result.Pointer());
    Conclude(row.code, error, rc, result);
}

void RunNextDay(const CommandRow& row, int count, char** words) {
    ErrorWord error(words[1]);
    DateOperand date;
    if (!date.Resolve(words[2], error)) return;
    OCIError* const handle = error.Get();
    TextArgument day;
    if (!SetTextWords(day, words + 3)) return;
    ResultPlace<OCIDate> result(count, words, 5);
    const sword rc = Call(&ClientLibrary::OCIDateNextDay, handle, date.Argument(), day.Text(), day.Length(),
                          result.Pointer());
    Conclude(row.code, handle, rc, result);
}

// Printed only when the last word asks for it; stored never.
void RunSysDate(const CommandRow& row, int count, char** words) {
    OCIError* const error = ResolveError<OCIError>(words[1]);
    ResultPlace<OCIDate> result(count, words, 2);
    const sword rc = Call(&ClientLibrary::OCIDateSysDate, error, result.Pointer());
    TraceAndReport(row.code, "", error, rc);
    const bool wanted = count > 2 && std::strcmp(words[count - 1], "-print") == 0;
    if (rc == OCI_SUCCESS && wanted) PrintDate(result.Value());
}

// An area that a text of at most `size` bytes fits in. A size below 0, which the library takes for a huge one, gets an
// area larger than any text of a date.
class TextOutput {
public:
    // Null after a complaint when there is no memory.
    OraText* OfSize(int size) {
        size_ = size < 0 ? kLargestDateText : static_cast<size_t>(size);
        area_.reset(static_cast<OraText*>(GetMem(size_)));
        if (area_ == nullptr) Message(kError, "Could not allocate memory\n");
        return area_.get();
    }
    // The text, as long as the library says but never longer than the area.
    void Print(ub4 length) const {
        Line line;
        if (AddText(line, area_.get(), std::min<size_t>(length, size_), Utf16Mode)) line.Character('\n').Print();
    }

private:
    static constexpr size_t kLargestDateText = 64 * 1024;
    Memory<OraText> area_;
    size_t size_ = 0;
};

void RunToText(const CommandRow& row, int count, char** words) {
    ErrorWord error(words[1]);
    DateOperand date;
    if (!date.Resolve(words[2], error)) return;
    OCIError* const handle = error.Get();
    TextArgument format;
    TextArgument language;
    if (!SetTextWords(format, words + 3) || !SetTextWords(language, words + 5)) return;
    const int typed = DecodeNumber(words[7]);
    TextOutput output;
    OraText* const area = output.OfSize(typed);
    if (area == nullptr) return;
    ub4 length = static_cast<ub4>(typed);
    ub4* const length_place = count == 10 && IsNull(words[8]) ? nullptr : &length;
    OraText* const text_place = count == 10 && IsNull(words[9]) ? nullptr : area;
    const sword rc = Call(&ClientLibrary::OCIDateToText, handle, date.Argument(), format.Text(),
                          static_cast<ub1>(format.Length()), language.Text(), language.Length(), length_place,
                          text_place);
    TraceAndReport(row.code, "", handle, rc);
    if (rc != OCI_SUCCESS) return;
    if (length_place != nullptr) Message(kOutput, "Length - %u\n", length);
    if (length_place != nullptr && text_place != nullptr) output.Print(length);
}

constexpr PlainCommand kDateConversions[] = {
    {{Code::ocidatefromtext, WordsBetween(8, 9),
      "OCIDateFromText hError date date_len fmt fmt_len lang lang_len [dateobj]"},
     RunFromText},
    {{Code::ocidatenextday, WordsBetween(5, 6), "OCIDateNextDay hError date dayname dayname_len [next_day]"},
     RunNextDay},
    {{Code::ocidatesysdate, WordsBetween(2, 4), "OCIDateSysDate hError [-print] [sys_date]"}, RunSysDate},
    {{Code::ocidatetotext, Words(8, 10),
      "OCIDateToText hError date format format_len lang lang_len maxlen [pcbText pText]"},
     RunToText},
};

}  // namespace

void AddDateCommands(HandlerTable& handlers) {
    handlers.Add<RunValueOperation<OCIDate, const OCIDate*>>(kOneDate);
    handlers.Add<RunValueOperation<OCIDate, const OCIDate*, int>>(kDateAndInt);
    handlers.Add<RunValueOperation<int, const OCIDate*, const OCIDate*>>(kTwoDates);
    handlers.Add<RunValueOperation<uword, const OCIDate*>>(kDateTests);
    handlers.Add(kDateConversions);
}
