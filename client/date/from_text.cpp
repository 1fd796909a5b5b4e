// Text to dates by a model. Without FX, blanks before an element are skipped, a mark may be another one or missing, a
// number may have fewer digits, and times at the end may be missing.
#include <algorithm>

#include "date/language.h"
#include "platform/letters.h"
#include "date/model.h"
#include "date/parsed.h"
#include "date/zone.h"
#include "handles/errors.h"

namespace date {
namespace {

constexpr MonthNames kRoman = {"i", "ii", "iii", "iv", "v", "vi", "vii", "viii", "ix", "x", "xi", "xii"};

// Words of two letters, with points or without: which one stands there and how it counts.
struct Word {
    std::string_view text;
    int value;
};
constexpr Word kHalfDays[] = {{"a.m.", 0}, {"p.m.", 1}, {"am", 0}, {"pm", 1}};
constexpr Word kEras[] = {{"a.d.", 1}, {"b.c.", -1}, {"ad", 1}, {"bc", -1}};

bool IsPunctuation(char c) { return c > ' ' && c < '\x7f' && !letters::IsLetter(c) && !letters::IsDigit(c); }
bool IsSign(char c) { return c == '+' || c == '-'; }
bool TakesSign(const Element& element) {
    return element.has_sign || element.field == Field::zone_hour || element.field == Field::zone_region;
}
bool TakesNumber(const Element& element) {
    return element.numeric || element.field == Field::fraction || element.field == Field::zone_hour ||
           element.field == Field::zone_minute || element.field == Field::comma_year;
}
// Of what takes no number.
bool TakesWord(const Element& element) {
    return element.field >= Field::year && element.field != Field::radix && element.field != Field::zone_region;
}
bool MayBeMissing(const Element& element) { return element.field >= Field::half_day; }

class Parser {
public:
    Parser(std::string_view text, std::string_view model, const Language& language, Scope scope)
        : rest_(text), model_(model), language_(language), scope_(scope) {}

    Errno Run(DateTime* result) {
        Element element;
        for (;;) {
            if (const Errno number = model_.Next(scope_, &element)) return number;
            if (element.field == Field::end) break;
            if (!element.input) return errors::kNotForInput;
            if (const Errno number = Take(element)) return number;
        }
        if (!exact_) SkipBlanks();
        return rest_.empty() ? parsed_.Resolve(result) : errors::kModelEnds;
    }

private:
    Errno Take(const Element& element) {
        switch (element.field) {
            case Field::fill: filled_ = !filled_; return 0;
            case Field::exact: exact_ = !exact_; return 0;
            case Field::mark: return TakeMark(element.text.front());
            case Field::quoted: return TakeQuoted(element.text);
            default: break;
        }
        if (const Errno number = parsed_.Claim(element)) return number;
        if (!exact_) SkipBlanks();
        if (rest_.empty()) return !exact_ && MayBeMissing(element) ? 0 : errors::kTextEnds;
        return TakeField(element);
    }

    Errno TakeField(const Element& element) {
        switch (element.field) {
            case Field::month: return TakeMonth(element);
            case Field::short_month_name:
                return TakeName(element, language_.short_months, language_.months, errors::kBadMonth);
            case Field::month_name:
                return TakeName(element, language_.months, language_.short_months, errors::kBadMonth);
            case Field::roman_month: return TakeName(element, kRoman, kRoman, errors::kBadMonth);
            case Field::short_day_name:
                return TakeName(element, language_.short_days, language_.days, errors::kBadWeekday);
            case Field::day_name: return TakeName(element, language_.days, language_.short_days, errors::kBadWeekday);
            case Field::half_day: return TakeWord(element, kHalfDays, errors::kNoHalfDay);
            case Field::era: return TakeWord(element, kEras, errors::kNoEra);
            case Field::comma_year: return TakeCommaYear(element);
            case Field::fraction: return TakeFraction(element);
            case Field::radix: return TakeRadix();
            case Field::zone_hour: return TakeZoneHour(element);
            case Field::zone_region: return TakeRegion();
            case Field::zone_short_name: return TakeZoneName();
            default: return TakeNumber(element);
        }
    }

    void SkipBlanks() { rest_ = letters::WithoutLeadingBlanks(rest_); }

    bool TakeChar(char wanted) {
        if (!rest_.starts_with(wanted)) return false;
        rest_.remove_prefix(1);
        return true;
    }

    [[nodiscard]] Element Following() const {
        Model ahead = model_;
        Element element;
        return ahead.Next(scope_, &element) ? Element{} : element;
    }

    Errno TakeMark(char mark) {
        if (exact_) return rest_.empty() ? errors::kTextEnds : TakeChar(mark) ? 0 : errors::kTextMismatch;
        const std::size_t before = rest_.size();
        SkipBlanks();
        if (rest_.empty() || (mark == ' ' && rest_.size() != before)) return 0;
        const Element next = Following();
        const char c = rest_.front();
        if (IsPunctuation(c) && !(IsSign(c) && c != mark && TakesSign(next))) {
            rest_.remove_prefix(1);
            return 0;
        }
        if (rest_.size() != before) return 0;
        // The mark is missing: what stands here must at least suit what comes next.
        const bool fits = TakesNumber(next) ? letters::IsDigit(c) || IsSign(c) : !TakesWord(next) || letters::IsWordByte(c);
        if (!fits) return errors::kTextMismatch;
        return 0;
    }

    Errno TakeQuoted(std::string_view wanted) {
        if (!exact_ && !wanted.starts_with(' ')) SkipBlanks();
        if (rest_.size() < wanted.size()) return errors::kTextEnds;
        if (!letters::StartsWithFolded(rest_, wanted)) return errors::kTextMismatch;
        rest_.remove_prefix(wanted.size());
        return 0;
    }

    std::size_t CountDigits(std::size_t most) const {
        int value = 0;
        std::string_view ahead = rest_;
        return letters::TakeDigits(ahead, most, &value);
    }

    // How many digits belong to a number. A short year takes four when just four stand there and no number follows.
    std::size_t DigitsOf(const Element& element) const {
        const bool year = SlotOf(element.field) == Field::year;
        return year && !exact_ && CountDigits(5) == 4 && !Following().numeric ? 4 : CountDigits(element.width);
    }

    int TakeDigits(std::size_t count) {
        int value = 0;
        letters::TakeDigits(rest_, count, &value);
        return value;
    }

    Errno TakeNumber(const Element& element) {
        const bool negative = element.has_sign && TakeChar('-');
        if (element.has_sign && !negative) {
            TakeChar('+');
            SkipBlanks();    // what stands for a plus
        }
        const std::size_t digits = DigitsOf(element);
        if (digits == 0) return errors::kNoDigit;
        if (exact_ && filled_ && digits != element.width) return errors::kWrongDigits;
        const int value = TakeDigits(digits);
        return parsed_.Set(element, negative ? -value : value, digits);
    }

    Errno TakeCommaYear(const Element& element) {
        const std::size_t thousands = CountDigits(1);
        if (thousands == 0) return errors::kNoDigit;
        const int value = TakeDigits(thousands);
        if (!TakeChar(',')) return errors::kTextMismatch;
        if (CountDigits(3) != 3) return errors::kWrongDigits;
        return parsed_.Set(element, value * 1000 + TakeDigits(3), 4);
    }

    Errno TakeMonth(const Element& element) {
        if (exact_ || !letters::IsWordByte(rest_.front())) return TakeNumber(element);
        return TakeName(element, language_.months, language_.short_months, errors::kBadMonth);
    }

    // FX takes the name in the form that the model asks for, and the blanks that fill it up.
    template <std::size_t count>
    Errno TakeName(const Element& element, const std::array<std::string_view, count>& names,
                   const std::array<std::string_view, count>& others, Errno otherwise) {
        std::size_t length = 0;
        const int found = FindName(names, exact_ ? names : others, rest_, &length);
        if (found < 0) return count == 7 && !letters::IsWordByte(rest_.front()) ? errors::kNoLetter : otherwise;
        const std::size_t width = NameWidth(names), written = letters::CharacterCount(rest_.substr(0, length));
        rest_.remove_prefix(length);
        for (std::size_t i = written; exact_ && filled_ && i < width && TakeChar(' '); ++i) continue;
        return parsed_.Set(element, found + 1, length);
    }

    template <std::size_t count>
    Errno TakeWord(const Element& element, const Word (&words)[count], Errno otherwise) {
        for (const Word& word : words) {
            if (!letters::StartsWithFolded(rest_, word.text)) continue;
            rest_.remove_prefix(word.text.size());
            return parsed_.Set(element, word.value, 0);
        }
        return letters::IsWordByte(rest_.front()) ? otherwise : errors::kNoLetter;
    }

    Errno TakeRadix() {
        if (exact_ && rest_.front() != '.') return errors::kTextMismatch;
        if (!TakeChar('.')) TakeChar(',');
        return 0;
    }

    // Digits may be missing altogether, with the point before them.
    Errno TakeFraction(const Element& element) {
        const std::size_t digits = CountDigits(element.width ? element.width : 9);
        if (exact_ && filled_ && element.width && digits != element.width) return errors::kWrongDigits;
        auto nanosecond = static_cast<std::uint32_t>(TakeDigits(digits));
        for (std::size_t i = digits; i < 9; ++i) nanosecond *= 10;
        parsed_.SetFraction(nanosecond);
        return 0;
    }

    Errno TakeZoneHour(const Element& element) {
        const bool west = TakeChar('-');
        if (!west) TakeChar('+');
        parsed_.SetZoneSign(west);
        return TakeNumber(element);
    }

    Errno TakeRegion() {
        const std::size_t length = std::min(rest_.find(' '), rest_.size());
        parsed_.SetRegion(rest_.substr(0, length));
        rest_.remove_prefix(length);
        return 0;
    }

    // Only tells which of two same hours is meant; the region's own rule decides that.
    Errno TakeZoneName() {
        if (!letters::IsLetter(rest_.front())) return errors::kNoZone;
        while (!rest_.empty() && letters::IsLetter(rest_.front())) rest_.remove_prefix(1);
        return 0;
    }

    std::string_view rest_;
    Model model_;
    const Language& language_;
    Scope scope_;
    Parsed parsed_;
    bool filled_ = true;
    bool exact_ = false;
};

}  // namespace

Errno FromText(std::string_view text, std::string_view model, const Language& language, Scope scope,
               DateTime* result) noexcept {
    return Parser(text, model, language, scope).Run(result);
}

}  // namespace date
