// Numbers to text by a model. A text is put together twice: once to know its length, then behind the blanks that fill
// it up to the width of the model.
#include "platform/letters.h"
#include "handles/errors.h"
#include "number/decimal.h"
#include "number/format.h"
#include "number/format_model.h"

namespace number {

namespace {

constexpr int kMostFixedCharacters = 64;  // of TM

// What one conversion works on. `decimal` is rounded to the places of the model.
struct Job {
    const FormatModel& model;
    const Nls& nls;
    Decimal decimal;

    [[nodiscard]] bool WholeIsZero() const { return decimal.point <= 0; }
    [[nodiscard]] bool IsZero() const { return decimal.count == 0; }
    // The digit that many places left of the point, from 0, or right of it, from -1.
    [[nodiscard]] char Digit(int place) const {
        const int index = decimal.point - 1 - place;
        return index >= 0 && index < decimal.count ? decimal.digits[index] : '0';
    }
};

std::string_view Money(const Job& job) {
    switch (job.model.currency_element) {
        case 'L': return job.nls.currency;
        case 'C': return job.nls.iso_currency;
        case 'U': return job.nls.dual_currency;
        default: return "$";
    }
}

void PutPoint(const Job& job, Writer* out) {
    if (job.model.point == '.')
        out->Put('.');
    else if (job.model.point == 'D')
        out->Put(job.nls.decimal);
    else if (job.model.currency == FormatModel::Currency::point)
        out->Put(Money(job));
}

void PutSignBefore(const Job& job, Writer* out) {
    const bool negative = job.decimal.negative;
    switch (job.model.sign) {
        case FormatModel::Sign::before:
            if (negative) out->Put('-');
            break;
        case FormatModel::Sign::leading_s: out->Put(negative ? '-' : '+'); break;
        case FormatModel::Sign::brackets:
            if (negative) out->Put('<');
            break;
        default: break;
    }
}

void PutSignAfter(const Job& job, Writer* out) {
    const bool negative = job.decimal.negative;
    switch (job.model.sign) {
        case FormatModel::Sign::trailing_s: out->Put(negative ? '-' : '+'); break;
        case FormatModel::Sign::trailing_minus:
            if (negative || job.model.fill) out->Put(negative ? '-' : ' ');
            break;
        case FormatModel::Sign::brackets:
            if (negative || job.model.fill) out->Put(negative ? '>' : ' ');
            break;
        default: break;
    }
}

// Fraction places that are printed: without fill, those up to the last digit or 0 element.
int PlacesShown(const Job& job) {
    if (job.model.fill) return job.model.places_after;
    return std::max(job.model.zeros_after, job.decimal.count - job.decimal.point);
}

// The digits before the point, without what leading places leave empty.
void PutWhole(const Job& job, Writer* out) {
    const FormatModel& model = job.model;
    if (model.blank_zero && job.WholeIsZero()) return;
    const int after = model.point == 'V' ? model.places_after : 0;
    int place = model.places_before + after;
    bool started = false;
    const auto put_place = [&](bool last_when_zero) {
        --place;
        started = place < job.decimal.point || place < model.zeros_before || (last_when_zero && place == 0);
        if (started) out->Put(job.Digit(place));
    };
    const bool units_zero = PlacesShown(job) == 0 || model.point == 'V';
    for (const char element : model.whole) {
        if (IsPlace(element))
            put_place(units_zero);
        else if (IsGroup(element) && started)
            out->Put(element == ',' ? ',' : job.nls.group);
    }
    while (place > 0) put_place(true);
}

void PutFixedBody(const Job& job, Writer* out) {
    PutWhole(job, out);
    if (job.model.point == 'V') return;
    PutPoint(job, out);
    const int shown = PlacesShown(job);
    for (int place = 1; place <= shown; ++place) out->Put(job.Digit(-place));
}

void PutScientificBody(const Job& job, Writer* out) {
    const int top = job.IsZero() ? 0 : job.decimal.point - 1;
    out->Put(job.Digit(top));
    PutPoint(job, out);
    const int shown = job.model.fill
                          ? job.model.places_after
                          : std::max(job.model.zeros_after, job.decimal.count - 1);
    for (int place = 1; place <= shown; ++place) out->Put(job.Digit(top - place));
    PutExponent(top, out);
}

void PutNumber(const Job& job, Writer* out) {
    if (job.model.blank_zero && job.IsZero()) return;
    PutSignBefore(job, out);
    if (job.model.currency == FormatModel::Currency::leading) out->Put(Money(job));
    if (job.model.scientific)
        PutScientificBody(job, out);
    else
        PutFixedBody(job, out);
    if (job.model.currency == FormatModel::Currency::trailing) out->Put(Money(job));
    PutSignAfter(job, out);
}

// Characters of the widest text that the model gives.
std::size_t Width(const Job& job) {
    const FormatModel& model = job.model;
    const std::size_t money = model.currency == FormatModel::Currency::none ? 0 : letters::CharacterCount(Money(job));
    const std::size_t point = model.point == '.' || model.point == 'D';
    const std::size_t signs = model.sign == FormatModel::Sign::brackets ? 2 : 1;
    if (model.scientific) {
        const int exponent = job.IsZero() ? 0 : job.decimal.point - 1;
        const std::size_t exponent_length = exponent >= 100 || exponent <= -100 ? 5 : 4;
        return signs + money + 1 + point + static_cast<std::size_t>(model.places_after) + exponent_length;
    }
    std::size_t groups = 0;
    for (const char element : model.whole) groups += IsGroup(element);
    return signs + money + point + groups + static_cast<std::size_t>(model.places_before + model.places_after);
}

// Runs `put` behind the blanks that fill its text up to `width` characters.
template <class Put> void PutFilled(bool fill, std::size_t width, Writer* out, Put put) {
    char counted[256];
    Writer trial(counted, sizeof counted);
    put(&trial);
    if (fill) {
        const std::size_t bytes = std::min(trial.Length(), sizeof counted);
        const std::size_t extra = bytes - letters::CharacterCount({counted, bytes});
        out->Repeat(' ', static_cast<std::ptrdiff_t>(width + extra) - static_cast<std::ptrdiff_t>(trial.Length()));
    }
    put(out);
}

int WholePlaces(const Decimal& decimal) { return std::max(decimal.point, 0); }

Decimal DecimalOf(const OCINumber& value) {
    Digits digits;
    Unpack(value, &digits);
    return ToDecimal(digits);
}

// Keeps the first `kept` digits, which may be none or fewer, half away from zero.
void RoundDigits(Decimal* decimal, int kept) {
    if (kept >= decimal->count) return;
    const bool up = kept >= 0 && decimal->digits[kept] >= '5';
    decimal->count = std::max(kept, 0);
    const char stripped = up ? '9' : '0';
    while (decimal->count > 0 && decimal->digits[decimal->count - 1] == stripped) --decimal->count;
    if (up && decimal->count > 0) {
        ++decimal->digits[decimal->count - 1];
    } else if (up) {
        decimal->digits[decimal->count++] = '1';
        ++decimal->point;
    }
    if (decimal->count == 0) decimal->point = 0;
}

// Rounds in decimal digits, so that all of them are kept whatever the point does. A negative value keeps its sign when
// it becomes 0, as the model's elements speak of the value.
Errno PutFixedModel(const OCINumber& value, const FormatModel& model, const Nls& nls, Writer* out) {
    constexpr int kHighestPoint = 2 * (kMaxExponent + 1);
    Job job{model, nls, DecimalOf(value)};
    if (!model.scientific && WholePlaces(job.decimal) > model.places_before) {
        out->Repeat('#', static_cast<std::ptrdiff_t>(Width(job)));
        return 0;
    }
    RoundDigits(&job.decimal, model.scientific ? model.places_after + 1 : job.decimal.point + model.places_after);
    const int most_whole = model.scientific ? kHighestPoint : model.places_before;
    if (WholePlaces(job.decimal) > most_whole) return errors::kRoundingOverflow;
    if (model.point == 'V' && !job.IsZero()) job.decimal.point += model.places_after;
    PutFilled(model.fill, Width(job), out, [&](Writer* writer) { PutNumber(job, writer); });
    return 0;
}

// The hexadecimal digits of a whole number, from the last; answers how many there are.
int HexadecimalDigits(const Decimal& decimal, char* digits) {
    constexpr int kMostPlaces = 2 * (kMaxExponent + 1);
    int places[kMostPlaces] = {};
    for (int i = 0; i < decimal.point; ++i) places[i] = i < decimal.count ? decimal.digits[i] - '0' : 0;
    int count = 0;
    for (int first = 0; first < decimal.point;) {
        int rest = 0;
        for (int i = first; i < decimal.point; ++i) {
            rest = rest * 10 + places[i];
            places[i] = rest / 16;
            rest %= 16;
        }
        digits[count++] = static_cast<char>(rest);
        while (first < decimal.point && places[first] == 0) ++first;
    }
    return count;
}

Errno PutHexadecimal(const OCINumber& value, const FormatModel& model, Writer* out) {
    OCINumber rounded;
    if (const Errno error = Round(value, 0, &rounded)) return error;
    const Decimal decimal = DecimalOf(rounded);
    if (decimal.negative) return errors::kBadNumber;
    char digits[128];
    const int count = HexadecimalDigits(decimal, digits);
    const int shown = std::max({count, model.zeros_before, 1});
    if (shown > model.places_before) {
        out->Repeat('#', model.places_before + model.fill);
        return 0;
    }
    if (model.fill) out->Repeat(' ', model.places_before - shown + 1);
    const std::string_view letters = model.lower_case ? "0123456789abcdef" : "0123456789ABCDEF";
    out->Repeat('0', shown - count);
    for (int i = count; i-- > 0;) out->Put(letters[static_cast<std::size_t>(digits[i])]);
    return 0;
}

Errno PutRoman(const OCINumber& value, const FormatModel& model, Writer* out) {
    OCINumber rounded;
    std::int64_t number = 0;
    if (const Errno error = Round(value, 0, &rounded)) return error;
    const bool held = ToInt64(rounded, &number) == 0 && number >= 1 && number <= kLargestRoman;
    if (!held) {
        out->Repeat('#', kRomanWidth);
        return 0;
    }
    PutFilled(model.fill, kRomanWidth, out, [&](Writer* writer) {
        char letters[kRomanWidth];
        for (const char letter : SpellRoman(static_cast<int>(number), letters))
            writer->Put(model.lower_case ? static_cast<char>(letter - 'A' + 'a') : letter);
    });
    return 0;
}

void PutShortest(const OCINumber& value, const FormatModel& model, const Nls& nls, Writer* out) {
    const Decimal decimal = DecimalOf(value);
    const int characters = FixedPlaces(decimal) + decimal.negative + (decimal.count > decimal.point);
    const bool scientific =
        model.kind == FormatModel::Kind::shortest_scientific || characters > kMostFixedCharacters;
    if (decimal.negative) out->Put('-');
    if (scientific)
        PutScientific(decimal, nls.decimal, out);
    else
        PutFixed(decimal, nls.decimal, out);
}

Errno PutByModel(const OCINumber& value, const FormatModel& model, const Nls& nls, Writer* out) {
    switch (model.kind) {
        case FormatModel::Kind::hexadecimal: return PutHexadecimal(value, model, out);
        case FormatModel::Kind::roman: return PutRoman(value, model, out);
        case FormatModel::Kind::fixed: return PutFixedModel(value, model, nls, out);
        default: PutShortest(value, model, nls, out); return 0;
    }
}

Errno PutPlain(const OCINumber& value, const Nls& nls, Writer* out) {
    char plain[kMaxPlainText];
    std::size_t length = 0;
    if (const Errno error = ToPlainText(value, nls.decimal, plain, &length)) return error;
    out->Put(std::string_view{plain, length});
    return 0;
}

}  // namespace

Errno ToText(const OCINumber& value, std::string_view model, const Nls& nls, char* text, std::size_t capacity,
             std::size_t* length) noexcept {
    FormatModel parsed;
    if (!IsValid(value)) return errors::kBadNumber;
    const bool plain = model.empty() || IsInfinite(value);
    if (!model.empty()) {
        if (const Errno error = ParseFormat(model, &parsed)) return error;
    }
    Writer out(text, capacity);
    if (const Errno error = plain ? PutPlain(value, nls, &out) : PutByModel(value, parsed, nls, &out)) return error;
    *length = out.Length();
    return out.Overflowed() ? errors::kBufferTooSmall : 0;
}

}  // namespace number
