// What a column's declaration makes of a value that is stored into it: numbers from text, rounded to the scale; dates
// from text; texts and bytes that must fit. SQLite itself stores anything anywhere. An object serves one thread at a time.
#pragma once

#include <string>

#include "date/date.h"
#include "engine/engine.h"
#include "engine/sqlite/date_text.h"
#include "oci.h"

namespace engine::sqlite {

class Coercion {
public:
    // A value that is compared with a column is read as the column's type, but neither rounded nor measured. One that
    // passes a query on its way into a column stays as it is, and must not be a row id.
    enum class Purpose : std::uint8_t { store, compare, pass };

    // Of a real that is bound every digit counts, of one that the engine computed as many as of a number.
    enum class Origin : std::uint8_t { bound, computed };

    explicit Coercion(Column column, Purpose purpose = Purpose::store, Origin origin = Origin::bound);

    // Whether values of the column need a look at all; whether those compared with it do.
    static bool Concerns(const Column& column);
    static bool ConcernsComparison(const Column& column);

    // The Datum may point into this object afterwards, until the next call.
    Status Apply(Datum& value);

private:
    Status ApplyNumber(Datum& value);
    Status ApplyBinary(Datum& value);
    Status ApplyDigits(Datum& value);
    void KeepAmongReals(Datum& value);
    Status ApplyDecimal(const OCINumber& number, Datum& value);
    Status ApplyText(Datum& value);
    bool ReadReal(double real);
    void WriteNumber(Datum& value);
    void WriteBytes(Datum& value);
    Status ApplyBytes(Datum& value);
    Status ApplyDate(Datum& value);
    Status ApplyInterval(Datum& value);
    void SetDate(const date::DateTime& date, Datum& value);    // in the text form that dates have in a file
    Status ApplySize(const Datum& value);
    [[nodiscard]] Status Refuse(int number) const;

    Column column_;
    Purpose purpose_;
    Origin origin_;
    bool among_reals_;
    OCINumber number_{};
    DateText date_{};
    std::string text_;
};

}  // namespace engine::sqlite
