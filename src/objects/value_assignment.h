// Texts of a script stored into elements, by external data type. Command thread only.
#pragma once

#include <cstdint>

// An element to be filled.
struct ElementTarget {
    int type;
    unsigned char* data;
    uint32_t size;
    int16_t* indicator;
    uint16_t* length;
    uint16_t* return_code;
    uint16_t precision;  // packed decimal only
    int16_t scale;
};

// Stores `length` bytes of the word, never past the end of the element; zeros stand in for what the word lacks. "null"
// sets the indicator to -1 and the length to 0. False when the word cannot be read as the type:
// "Invalid value - %s\n" has been printed and the element is as it was.
bool AssignText(const ElementTarget& target, const char* word, long length);
