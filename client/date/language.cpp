// The languages.
#include "date/language.h"

#include "platform/letters.h"
#include "handles/errors.h"

namespace date {
namespace {

constexpr Language kLanguages[] = {
    {{"AMERICAN", "ENGLISH"},
     {"january", "february", "march", "april", "may", "june", "july", "august", "september", "october", "november",
      "december"},
     {"jan", "feb", "mar", "apr", "may", "jun", "jul", "aug", "sep", "oct", "nov", "dec"},
     {"sunday", "monday", "tuesday", "wednesday", "thursday", "friday", "saturday"},
     {"sun", "mon", "tue", "wed", "thu", "fri", "sat"},
     "fmDay, Month DD, YYYY", "fmMM/DD/RRRR", "HH:MI:SS AM"},
    {{"GERMAN", "DEUTSCH"},
     {"januar", "februar", "märz", "april", "mai", "juni", "juli", "august", "september", "oktober", "november",
      "dezember"},
     {"jan", "feb", "mrz", "apr", "mai", "jun", "jul", "aug", "sep", "okt", "nov", "dez"},
     {"sonntag", "montag", "dienstag", "mittwoch", "donnerstag", "freitag", "samstag"},
     {"so", "mo", "di", "mi", "do", "fr", "sa"},
     "fmDay, DD. Month YYYY", "DD.MM.RRRR", "HH24:MI:SS"},
    {{"FRENCH", "FRANCAIS"},
     {"janvier", "février", "mars", "avril", "mai", "juin", "juillet", "août", "septembre", "octobre", "novembre",
      "décembre"},
     {"janv.", "févr.", "mars", "avr.", "mai", "juin", "juil.", "août", "sept.", "oct.", "nov.", "déc."},
     {"dimanche", "lundi", "mardi", "mercredi", "jeudi", "vendredi", "samedi"},
     {"dim.", "lun.", "mar.", "mer.", "jeu.", "ven.", "sam."},
     "fmday DD month YYYY", "DD/MM/RRRR", "HH24:MI:SS"},
    {{"SPANISH", "ESPANOL"},
     {"enero", "febrero", "marzo", "abril", "mayo", "junio", "julio", "agosto", "septiembre", "octubre", "noviembre",
      "diciembre"},
     {"ene", "feb", "mar", "abr", "may", "jun", "jul", "ago", "sep", "oct", "nov", "dic"},
     {"domingo", "lunes", "martes", "miércoles", "jueves", "viernes", "sábado"},
     {"dom", "lun", "mar", "mié", "jue", "vie", "sáb"},
     "fmDay, DD \"de\" Month \"de\" YYYY", "DD/MM/RRRR", "HH24:MI:SS"},
    {{"ITALIAN", "ITALIANO"},
     {"gennaio", "febbraio", "marzo", "aprile", "maggio", "giugno", "luglio", "agosto", "settembre", "ottobre",
      "novembre", "dicembre"},
     {"gen", "feb", "mar", "apr", "mag", "giu", "lug", "ago", "set", "ott", "nov", "dic"},
     {"domenica", "lunedì", "martedì", "mercoledì", "giovedì", "venerdì", "sabato"},
     {"dom", "lun", "mar", "mer", "gio", "ven", "sab"},
     "fmday DD month YYYY", "DD/MM/RRRR", "HH24:MI:SS"},
};

}  // namespace

const Language& kEnglish = kLanguages[0];

// A territory may follow the name: GERMAN_AUSTRIA.
const Language* FindLanguage(std::string_view name) noexcept {
    name = name.substr(0, name.find_first_of("_."));
    for (const Language& language : kLanguages) {
        for (const std::string_view known : language.names) {
            if (letters::EqualFolded(name, known)) return &language;
        }
    }
    return nullptr;
}

template <std::size_t count>
int FindName(const std::array<std::string_view, count>& full, const std::array<std::string_view, count>& brief,
             std::string_view text, std::size_t* length) noexcept {
    int found = -1;
    *length = 0;
    for (std::size_t i = 0; i < count; ++i) {
        for (const std::string_view name : {full[i], brief[i]}) {
            if (name.size() <= *length || !letters::StartsWithFolded(text, name)) continue;
            found = static_cast<int>(i);
            *length = name.size();
        }
    }
    return found;
}

template int FindName(const MonthNames&, const MonthNames&, std::string_view, std::size_t*) noexcept;
template int FindName(const DayNames&, const DayNames&, std::string_view, std::size_t*) noexcept;

Errno WeekdayFromName(std::string_view name, const Language& language, int* day_of_week) noexcept {
    std::size_t length = 0;
    const int found = FindName(language.days, language.short_days, name, &length);
    if (found < 0 || length != name.size()) return errors::kBadWeekday;
    *day_of_week = found;
    return 0;
}

}  // namespace date
