// Settings in an INI file: sections, keys and values. A plain file name means that file in the directory KELPCI_HOME,
// or in the current directory when that is not set.
//
// Sections and keys are found whatever their case, blanks around names and values do not count, lines that begin with
// ';' or '#' are comments. The first of several equal keys holds. The file is read anew by each call. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

// Copies the value, or `otherwise` where there is none, cut to the capacity and terminated.
// With a null key, all keys of the section in the order of the file, each ended by a NUL, and an empty one: keys that
// do not fit whole are left out. Answers the bytes written, the closing NUL not counted.
std::size_t IniReadString(const char* file, const char* section, const char* key, const char* otherwise, char* buffer,
                          std::size_t capacity);

// All settings of a section in the order of the file, each key once, from one reading of the file. `most_key_bytes`
// limits them as the capacity limits the keys above.
struct IniSetting {
    std::string key;
    std::string value;
};
std::vector<IniSetting> IniReadSection(const char* file, const char* section, std::size_t most_key_bytes);

// Sets a key, and makes file and section where they are missing. A null value removes the key. Everything else in the
// file stays to the byte: comments, order, unknown lines, line ends; so do its permissions. The file is replaced as a
// whole, so that a reader or a crash finds the old or the new one. False when it cannot be written, or when section,
// key or value could not be read back: a line end in them, blanks around a name, an empty key, a key with '='.
bool IniWriteString(const char* file, const char* section, const char* key, const char* value);
