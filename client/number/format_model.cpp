#include "number/format_model.h"

#include "platform/letters.h"
#include "handles/errors.h"

namespace number {

namespace {

using Kind = FormatModel::Kind;
using Sign = FormatModel::Sign;
using Currency = FormatModel::Currency;

// Reads a fixed or scientific model, element by element.
class FixedParser {
public:
    FixedParser(std::string_view text, FormatModel* model) : text_(text), model_(*model) {}

    bool Parse() {
        std::size_t whole_end = text_.size();
        while (at_ < text_.size()) {
            const std::size_t start = at_;
            if (ended_ || !Element()) return false;
            if (model_.point != 0 && whole_end == text_.size()) whole_end = start;
        }
        model_.whole = text_.substr(0, whole_end);
        return Places() > 0;
    }

private:
    [[nodiscard]] int Places() const { return model_.places_before + model_.places_after; }

    bool Take(std::string_view word) {
        if (!letters::StartsWithFolded(text_.substr(at_), word)) return false;
        at_ += word.size();
        return true;
    }

    bool Element() {
        if (Take("EEEE")) return Exponent();
        if (Take("MI")) return EndSign(Sign::trailing_minus);
        if (Take("PR")) return EndSign(Sign::brackets);
        const char element = letters::ToUpper(text_[at_++]);
        switch (element) {
            case '9': return Place(false);
            case '0': return Place(true);
            case '.':
            case 'D':
            case 'V': return Point(element);
            case ',':
            case 'G': return Group(element);
            case '$':
            case 'L':
            case 'C':
            case 'U': return Money(element);
            case 'B': return Once(&model_.blank_zero);
            case 'S': return SignElement();
            default: return false;
        }
    }

    static bool Once(bool* flag) {
        const bool first = !*flag;
        *flag = true;
        return first;
    }

    bool Place(bool zero) {
        if (model_.scientific || model_.currency == Currency::trailing) return false;
        const bool whole = model_.point == 0 || model_.point == 'V';
        ++(model_.point == 0 ? model_.places_before : model_.places_after);
        if (whole && (model_.zeros_before > 0 || zero)) ++model_.zeros_before;
        if (!whole && zero) model_.zeros_after = model_.places_after;
        return true;
    }

    bool Point(char element) {
        if (model_.point != 0 || model_.scientific || model_.currency == Currency::trailing) return false;
        if ((element == '.' && group_ == 'G') || (element == 'D' && group_ == ',')) return false;
        model_.point = element;
        return true;
    }

    bool Group(char element) {
        if (model_.places_before == 0 || model_.point != 0 || model_.scientific) return false;
        if (group_ != 0 && group_ != element) return false;
        group_ = element;
        model_.groups = true;
        return true;
    }

    // A currency stands before the places, after them or for the point between them; the dollar sign always before.
    bool Money(char element) {
        if (model_.currency != Currency::none) return false;
        model_.currency_element = element;
        if (element == '$' || Places() == 0) {
            model_.currency = Currency::leading;
            return model_.point == 0 || element == '$';
        }
        const bool more = text_.substr(at_).find_first_of("09") == 0;
        model_.currency = more ? Currency::point : Currency::trailing;
        return more ? Point(element) : true;
    }

    bool SignElement() {
        if (at_ == 1) {
            model_.sign = Sign::leading_s;
            return true;
        }
        return EndSign(Sign::trailing_s);
    }

    bool EndSign(Sign sign) {
        if (model_.sign != Sign::before) return false;
        model_.sign = sign;
        ended_ = true;
        return true;
    }

    bool Exponent() {
        if (model_.scientific || model_.groups || model_.point == 'V' || model_.places_before == 0) return false;
        model_.scientific = true;
        return true;
    }

    std::string_view text_;
    FormatModel& model_;
    std::size_t at_ = 0;
    char group_ = 0;
    bool ended_ = false;
};

// Zeros, then X or x.
bool ParseHexadecimal(std::string_view text, FormatModel* model) {
    const std::size_t zeros = text.find_first_not_of('0');
    if (zeros == std::string_view::npos || letters::ToUpper(text[zeros]) != 'X') return false;
    if (text.find_first_not_of("xX", zeros) != std::string_view::npos) return false;
    model->kind = Kind::hexadecimal;
    model->lower_case = text[zeros] == 'x';
    model->places_before = static_cast<int>(text.size());
    model->zeros_before = zeros > 0 ? model->places_before : 0;
    return true;
}

}  // namespace

Errno ParseFormat(std::string_view text, FormatModel* model) noexcept {
    if (letters::StartsWithFolded(text, "FM")) {
        model->fill = false;
        text.remove_prefix(2);
    }
    if (letters::EqualFolded(text, "TM") || letters::EqualFolded(text, "TM9")) {
        model->kind = Kind::shortest;
    } else if (letters::EqualFolded(text, "TME")) {
        model->kind = Kind::shortest_scientific;
    } else if (letters::EqualFolded(text, "RN")) {
        model->kind = Kind::roman;
        model->lower_case = text[0] == 'r';
    } else if (!ParseHexadecimal(text, model)) {
        return FixedParser(text, model).Parse() ? 0 : errors::kBadNumberFormat;
    }
    return 0;
}

std::string_view SpellRoman(int value, char (&letters)[kRomanWidth]) {
    std::size_t length = 0;
    for (const RomanDigit& digit : kRomanDigits)
        for (; value >= digit.value; value -= digit.value) length += digit.letters.copy(letters + length, 2);
    return {letters, length};
}

}  // namespace number
