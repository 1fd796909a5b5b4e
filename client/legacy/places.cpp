// Binds and defines of cursors.
#include <array>
#include <charconv>
#include <limits>

#include "legacy/cursors.h"
#include "legacy/types.h"

namespace legacy {
namespace {

constexpr sword kMostColumns = std::numeric_limits<ub2>::max();

int SetScale(Cursor& cursor, dvoid* handle, ub4 kind, const Place& place) {
    if (place.type != SQLT_PDN || place.scale < 0) return 0;
    auto scale = static_cast<sb2>(place.scale);
    return Outcome(OCIAttrSet(handle, kind, &scale, 0, OCI_ATTR_PDSCL, cursor.error), cursor);
}

// Pieces under way are given up.
int Bind(Cursor& cursor, Name name, Place place, Table table) {
    if (!name.begin) return errors::kParameterMissing;
    if (name.length < -1) return errors::kParameterOutOfRange;
    if (const int failed = CheckType(place.value, place.type, place.length)) return failed;
    OCIBind* bind = nullptr;
    const int result = Outcome(OCIBindByName(cursor.statement, &bind, cursor.error, name.begin, name.length, place.value,
                                             place.length, static_cast<ub2>(place.type), place.indicator, place.lengths,
                                             place.codes, table.most, table.current, OCI_DEFAULT),
                               cursor);
    if (result != 0) return result;
    cursor.waits = Cursor::Waits::no;
    return SetScale(cursor, bind, OCI_HTYPE_BIND, place);
}

int DefineColumn(Cursor& cursor, sword position, Place place) {
    if (position < 1 || position > kMostColumns) return errors::kNoSuchColumn;
    ub4 columns = 0;
    (void)OCIAttrGet(cursor.statement, OCI_HTYPE_STMT, &columns, nullptr, OCI_ATTR_PARAM_COUNT, cursor.error);
    if ((cursor.compiled || cursor.has_result) && static_cast<ub4>(position) > columns) return errors::kNoSuchColumn;
    if (const int failed = CheckType(place.value, place.type, place.length)) return failed;
    OCIDefine* define = nullptr;
    const int result = Outcome(OCIDefineByPos(cursor.statement, &define, cursor.error, static_cast<ub4>(position),
                                              place.value, place.length, static_cast<ub2>(place.type), place.indicator,
                                              place.lengths, place.codes, OCI_DEFAULT),
                               cursor);
    if (result != 0) return result;
    cursor.waits = Cursor::Waits::no;
    cursor.highest_define = std::max(cursor.highest_define, position);
    return SetScale(cursor, define, OCI_HTYPE_DEFINE, place);
}

}  // namespace

sword Define(Cda_Def* area, Function function, sword position, Place place) {
    return OnStatement(area, function, [&](Cursor& cursor) { return DefineColumn(cursor, position, place); });
}

sword BindName(Cda_Def* area, Function function, Name name, Place place, Table table) {
    return OnStatement(area, function, [&](Cursor& cursor) { return Bind(cursor, name, place, table); });
}

sword BindNumber(Cda_Def* area, sword number, Place place) {
    return OnStatement(area, Function::obndrn, [&](Cursor& cursor) -> int {
        if (number < 1) return errors::kNoSuchBind;
        std::array<char, 16> name{':'};
        const auto end = std::to_chars(name.data() + 1, name.data() + name.size(), number).ptr;
        return Bind(cursor, {reinterpret_cast<const text*>(name.data()), static_cast<sb4>(end - name.data())}, place, {});
    });
}

}  // namespace legacy
