// Reading info strings.
#include "xa/info.h"

#include <strings.h>

#include <charconv>
#include <cstdint>
#include <iterator>

namespace xa {
namespace {

bool Same(std::string_view left, std::string_view right) {
    return left.size() == right.size() && strncasecmp(left.data(), right.data(), left.size()) == 0;
}

bool ReadNumber(std::string_view text, std::uint32_t& number) {
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && stop == end;
}

// "P/user/password"; both may be empty for the operating-system user.
bool ReadAccount(std::string_view text, Info& info) {
    if (text.size() < 2 || !Same(text.substr(0, 2), "P/")) return false;
    text.remove_prefix(2);
    const std::size_t slash = text.find('/');
    if (slash == text.npos) return false;
    engine::Credentials& credentials = info.credentials;
    credentials.user = text.substr(0, slash);
    credentials.password = text.substr(slash + 1);
    credentials.external = credentials.user.empty() && credentials.password.empty();
    return credentials.external || (!credentials.user.empty() && !credentials.password.empty());
}

bool ReadName(std::string_view text, Info& info) {
    info.name = text;
    return !text.empty();
}

bool ReadServer(std::string_view text, Info& info) {
    info.server = text;
    return !text.empty();
}

bool ReadTimeout(std::string_view text, Info& info) {
    std::uint32_t seconds = 0;
    if (!ReadNumber(text, seconds)) return false;
    info.session_timeout = std::chrono::seconds(seconds);
    return true;
}

bool ReadThreads(std::string_view text, Info& info) {
    info.threads = Same(text, "true");
    return info.threads || Same(text, "false");
}

bool CheckNumber(std::string_view text, Info&) {
    std::uint32_t ignored = 0;
    return ReadNumber(text, ignored);
}

bool CheckText(std::string_view text, Info&) { return !text.empty(); }

struct Field {
    std::string_view key;
    bool (*read)(std::string_view text, Info& info);
};
constexpr Field kFields[] = {{"Acc", ReadAccount},      {"DB", ReadName},        {"SqlNet", ReadServer},
                             {"SesTm", ReadTimeout},    {"Threads", ReadThreads}, {"MaxCur", CheckNumber},
                             {"LogDir", CheckText}};

}  // namespace

bool ReadInfo(std::string_view text, Info& info) {
    bool seen[std::size(kFields)] = {};
    for (bool first = true; first || !text.empty(); first = false) {
        const std::size_t plus = text.find('+');
        const std::string_view field = text.substr(0, plus);
        if (plus != text.npos && plus + 1 == text.size()) return false;    // a field is missing at the end
        text.remove_prefix(plus == text.npos ? text.size() : plus + 1);
        const std::size_t equals = field.find('=');
        if (equals == field.npos) {
            if (!first) return false;
            continue;
        }
        std::size_t index = 0;
        while (index < std::size(kFields) && !Same(kFields[index].key, field.substr(0, equals))) ++index;
        if (index == std::size(kFields) || seen[index]) return false;
        seen[index] = true;
        if (!kFields[index].read(field.substr(equals + 1), info)) return false;
    }
    if (info.server.empty()) info.server = info.name;
    return true;
}

}  // namespace xa
