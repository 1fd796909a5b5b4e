// The attributes that scripts know by name: what each is called, its number, the shape in which the library takes and
// gives it, and the handles and descriptors that have it. Command thread only.
#pragma once

#include <cstdint>
#include <span>

// How a value lies in memory. Integers by their C types, handles by the kind that they are entered in.
enum class AttributeShape : uint8_t {
    ub1, ub2, ub4, ub8, sb1, sb2, sb4,
    text,     // a pointer to characters, their length in bytes beside it
    texts,    // an array of pointers to terminated texts, their count beside it
    server, session, trans, environment, param,
    rowid,    // a descriptor of the caller's, filled in place
    xid,      // filled in place
    date,     // a pointer to a date of seven bytes
    number,   // a pointer to the bytes of a number, their count beside it
    pointer,  // what scripts have no names for
};

struct AttributeRow {
    const char* keyword;
    uint32_t number;
    AttributeShape shape;
    uint8_t types[13];  // of the handles and descriptors that have it; 0 fills up
};

// In look-up order: a typed word is the first keyword that it begins, so a keyword stands before the longer ones that
// begin with it.
std::span<const AttributeRow> AttributeCatalogue();

struct Attribute {
    uint32_t number;
    AttributeShape shape;
};
// The attribute that a word stands for. A word that begins no keyword is a decimal number. One number serves several
// attributes: the library gives what the handle type has, whatever the word is, so the type tells the shape. Of a number
// that is no attribute of the type nothing is known: it is taken for an integer.
Attribute DecodeAttribute(const char* word, int handle_type);
