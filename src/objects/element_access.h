// Typed reading and writing of an element's bytes, never past the element's end and at any alignment. Any thread.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>

// The element's bytes as a T; bytes beyond the element are zero.
template <class T> T ReadElement(const unsigned char* data, size_t size) {
    T value{};
    std::memcpy(&value, data, std::min(sizeof value, size));
    return value;
}

// Stores as much of the value as the element holds.
template <class T> void WriteElement(unsigned char* data, size_t size, const T& value) {
    std::memcpy(data, &value, std::min(sizeof value, size));
}

// An integer of the width nearest below the element's size: 8, 4, 2 or 1 bytes.
template <class Wide, class Long, class Short, class Tiny> Wide ReadInteger(const unsigned char* data, size_t size) {
    if (size >= 8) return ReadElement<Wide>(data, size);
    if (size >= 4) return ReadElement<Long>(data, size);
    if (size >= 2) return ReadElement<Short>(data, size);
    return ReadElement<Tiny>(data, size);
}
inline int64_t ReadSigned(const unsigned char* data, size_t size) {
    return ReadInteger<int64_t, int32_t, int16_t, int8_t>(data, size);
}
inline uint64_t ReadUnsigned(const unsigned char* data, size_t size) {
    return ReadInteger<uint64_t, uint32_t, uint16_t, uint8_t>(data, size);
}

// The 7-byte date: century + 100, year of the century + 100, month, day, hour + 1, minute + 1, second + 1.
struct SevenByteDate {
    int year, month, day, hour, minute, second;

    // False when the bytes are no possible date.
    bool Read(const unsigned char* data, size_t size);
    // Stores the fields as they are.
    void Write(unsigned char* data, size_t size) const;
    bool Possible() const;
};

// The literal year-month-day-hour:minute:second. Reading stops at the first separator that is missing; the fields after
// it are 0. False when the text does not begin with a digit.
bool ReadDateLiteral(const char* text, SevenByteDate& date);
