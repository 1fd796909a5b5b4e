// Statement texts, cache keys and placeholder names as the application gives them: they end at a zero, wherever the
// length says, so that a length beyond a terminated text does no harm. Seen as UTF-8; converted from the
// environment's set, or from UTF-16 when the call says so.
#pragma once

#include <cstddef>
#include <cstring>
#include <string>
#include <string_view>

#include "handles/environment.h"
#include "oci.h"
#include "platform/utf.h"

class CallText {
public:
    CallText(const Environment& environment, const OraText* text, std::size_t length, bool utf16) {
        if (!text) return;
        const auto* begin = reinterpret_cast<const char*>(text);
        if (environment.Utf16() || utf16) {
            length = Utf16Length(text, length);
            if (environment.Utf16()) Convert(environment, {begin, length});
            else valid_ = utf::ToUtf8(text, length, converted_);
            view_ = converted_;
            return;
        }
        const void* zero = std::memchr(text, 0, length);
        view_ = {begin, zero ? static_cast<std::size_t>(static_cast<const char*>(zero) - begin) : length};
        if (!environment.Converts()) return;
        Convert(environment, view_);
        view_ = converted_;
    }
    [[nodiscard]] bool Valid() const { return valid_; }
    [[nodiscard]] std::string_view View() const { return view_; }

private:
    void Convert(const Environment& environment, std::string_view text) {
        valid_ = charset::ToUtf8(*environment.Sets().text, text, converted_);
    }
    static std::size_t Utf16Length(const OraText* text, std::size_t length) {
        std::size_t end = 0;
        while (end + 1 < length && (text[end] != 0 || text[end + 1] != 0)) end += 2;
        return end + 1 < length ? end : length;
    }

    std::string converted_;
    std::string_view view_;
    bool valid_ = true;
};
