// Each exported function on values and character sets with each of its pointers missing in turn.
#include <tuple>
#include <utility>

#include "support/call_fixture.h"

namespace {

struct NullArguments : CallFixture {
    // One letter for the call as it is given, then one for each pointer in its place: . success, h no handle, n 21560.
    template <class... Parameters, class... Given>
    std::string Nulls(sword (*call)(Parameters...), Given... given) {
        const std::tuple<Parameters...> good(given...);
        std::string answers;
        const auto add = [&](const std::tuple<Parameters...>& arguments) {
            size_ = sizeof text_;
            OCIDate today;
            OCIDateSysDate(err_, &today);    // leaves no record
            const sword code = std::apply(call, arguments);
            const sb4 number = FirstCode(err_) ? FirstCode(err_) : FirstCode(env_, OCI_HTYPE_ENV);
            const bool missing = code == OCI_ERROR && number == 21560;
            if (code == OCI_SUCCESS || code == OCI_INVALID_HANDLE) answers += code == OCI_SUCCESS ? '.' : 'h';
            else answers += missing ? "n" : std::to_string(number);
        };
        add(good);
        const auto without = [&]<std::size_t place>() {
            if constexpr (std::is_pointer_v<std::tuple_element_t<place, std::tuple<Parameters...>>>) {
                auto arguments = good;
                std::get<place>(arguments) = nullptr;
                add(arguments);
            }
        };
        [&]<std::size_t... places>(std::index_sequence<places...>) {
            (without.template operator()<places>(), ...);
        }(std::index_sequence_for<Parameters...>());
        return answers;
    }

    ub4 size_ = sizeof text_, flags_ = 0;
    size_t length_ = 0;
    sword order_ = 0;
    OraText text_[64] = {};
};

struct Row { const char* wanted; std::string got; };
void Compare(std::initializer_list<Row> rows) {
    for (const Row& row : rows) EXPECT_EQ(row.got, row.wanted) << "row " << &row - rows.begin();
}

TEST_F(NullArguments, OfNumbers) {
    OCINumber one;
    OCINumberSetPi(err_, &one);
    const OCINumber* list[] = {&one};
    double real = 1;
    Compare({{".hnn", Nulls(OCINumberToRealArray, err_, list, 1, 8, &real)},
             {".hn..n", Nulls(OCINumberFromText, err_, Text("1"), 1, Text("9"), 1, nullptr, 0, &one)},
             {".hn..nn", Nulls(OCINumberToText, err_, &one, Text("9.9"), 3, nullptr, 0, &size_, text_)}});
}

TEST_F(NullArguments, OfDatetimes) {
    auto* at = NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    auto* to = NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    EXPECT_EQ(OCIDateTimeSysTimeStamp(env_, err_, at), OCI_SUCCESS);
    auto* days = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    sb2 year = 0;
    ub1 part = 0;
    sb1 offset = 0;
    Compare({{".hhnn", Nulls(OCIDateTimeAssign, env_, err_, at, to)},
             {".hhnn", Nulls(OCIDateTimeCheck, env_, err_, at, &flags_)},
             {".hhnnn", Nulls(OCIDateTimeCompare, env_, err_, at, at, &order_)},
             {".hhn.", Nulls(OCIDateTimeConstruct, env_, err_, at, 2024, 7, 15, 1, 2, 3, 0, nullptr, 0)},
             {".hhnnnn", Nulls(OCIDateTimeGetDate, env_, err_, at, &year, &part, &part)},
             {".hhnnnnn", Nulls(OCIDateTimeGetTime, env_, err_, at, &part, &part, &part, &flags_)},
             {".hhn", Nulls(OCI_datetimeSetDate, env_, err_, at, 2024, 7, 15)},
             {".hhn", Nulls(OCI_datetimeSetTime, env_, err_, at, 1, 2, 3, 4)},
             {".hhn..n", Nulls(OCIDateTimeFromText, env_, err_, Text("01-JAN-24"), 9, nullptr, 0, nullptr, 0, at)},
             {".hhn..nn", Nulls(OCIDateTimeToText, env_, err_, at, Text("YYYY"), 4, 0, nullptr, 0, &size_, text_)},
             {".hhnnn", Nulls(OCIDateTimeGetTimeZoneOffset, env_, err_, at, &offset, &offset)},
             {".hhnnn", Nulls(OCIDateTimeGetTimeZoneName, env_, err_, at, text_, &size_)},
             {".hhnn", Nulls(OCIDateTimeConvert, env_, err_, at, to)},
             {".hhn", Nulls(OCIDateTimeSysTimeStamp, env_, err_, at)},
             {".hhnnn", Nulls(OCIDateTimeSubtract, env_, err_, at, at, days)},
             {".hhnnn", Nulls(OCIDateTimeIntervalAdd, env_, err_, at, days, at)},
             {".hhnnn", Nulls(OCIDateTimeIntervalSub, env_, err_, at, days, at)}});
}

TEST_F(NullArguments, OfIntervals) {
    auto* days = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    auto* months = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_YM);
    sb4 part[5];
    Compare({{".hhn", Nulls(OCIIntervalSetDaySecond, env_, err_, 1, 2, 3, 4, 5, days)},
             {".hhn", Nulls(OCIIntervalSetYearMonth, env_, err_, 1, 2, months)},
             {".hhnnnnnn", Nulls(OCIIntervalGetDaySecond, env_, err_, part, part + 1, part + 2, part + 3, part + 4, days)},
             {".hhnnn", Nulls(OCIIntervalGetYearMonth, env_, err_, part, part, months)},
             {"1867hhnnnnnn", Nulls(OCIIntervalGetDaySecond, env_, err_, part, part, part, part, part, months)},
             {".hhnn", Nulls(OCIIntervalFromText, env_, err_, Text("1"), 1, days)},
             {".hhnnn", Nulls(OCIIntervalToText, env_, err_, days, 2, 0, text_, sizeof text_, &length_)},
             {".hhnnn", Nulls(OCIIntervalAdd, env_, err_, days, days, days)},
             {".hhnnn", Nulls(OCIIntervalSubtract, env_, err_, days, days, days)},
             {".hhnnn", Nulls(OCIIntervalCompare, env_, err_, days, days, &order_)},
             {".hhnn", Nulls(OCIIntervalAssign, env_, err_, days, days)},
             {".hhnn", Nulls(OCIIntervalCheck, env_, err_, days, &flags_)}});
}

TEST_F(NullArguments, OfSets) {
    ub2 units[8] = {}, id = 0;
    sb4 value = 0;
    Compare({{".hn", Nulls(OCINlsCharSetIdToName, env_, text_, sizeof text_, 871)},
             {".hhnn.", Nulls(OCINlsCharSetConvert, env_, err_, 871, text_, 9, 873, "a", 1, &length_)},
             {".hhn", Nulls(OCINlsGetInfo, env_, err_, text_, sizeof text_, OCI_NLS_AM)},
             {".hhn", Nulls(OCINlsNumericInfoGet, env_, err_, &value, OCI_NLS_CHARSET_ID)},
             {".hnn.", Nulls(OCICharSetToUnicode, env_, units, 8, text_, 1, &length_)},
             {".hnn.", Nulls(OCIUnicodeToCharSet, env_, text_, 8, units, 1, &length_)}});
    EXPECT_EQ(OCIUnicodeToCharSet(env_, text_, 8, units, SIZE_MAX / 2 + 1, &length_), OCI_ERROR);
    EXPECT_EQ(FirstCode(env_, OCI_HTYPE_ENV), 21560);
    EXPECT_EQ(OCINlsEnvironmentVariableGet(units, sizeof units, OCI_NLS_NCHARSET_ID, 0, &length_), OCI_SUCCESS);
    EXPECT_EQ(length_, sizeof id);
    EXPECT_EQ(OCINlsEnvironmentVariableGet(nullptr, 2, OCI_NLS_CHARSET_ID, 0, &length_), OCI_ERROR);
    EXPECT_EQ(OCINlsEnvironmentVariableGet(&id, 2, OCI_NLS_DECIMAL, 0, &length_), OCI_ERROR);
}

}  // namespace
