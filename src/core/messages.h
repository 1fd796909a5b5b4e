// All text the driver writes. A message is formatted to standard output and then the named stream is flushed, so that
// the log is one ordered stream and the choice of stream decides only the flush. A line of the log is one message:
// whoever prints a line in pieces puts them together in a Line first. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

enum Stream {
    kOutput,  // results, traces, the prompt and the echo; flushes standard output
    kError    // complaints; written to standard output as well, flushes standard error
};

// Makes standard output hold a whole line of any length, so that a message is one write. Call once, before any output.
void PrepareMessages();

// Formats as printf does, then flushes the stream.
void Message(Stream stream, const char* format, ...) __attribute__((format(printf, 2, 3)));

// Writes the bytes as they are, then flushes the stream.
void MessageText(Stream stream, std::string_view text);

// Prints "Invalid Syntax: %s\n" with the usage text on the error stream.
void InvalidSyntax(const char* usage);

// A line in the making. Print writes it as one message and empties it; its room is kept for the next line.
class Line {
public:
    Line& Text(std::string_view text) {
        text_.append(text);
        return *this;
    }
    Line& Character(char character) {
        text_.push_back(character);
        return *this;
    }
    // The bytes as upper-case hexadecimal pairs.
    Line& Hex(const void* bytes, size_t length);
    Line& Format(const char* format, ...) __attribute__((format(printf, 2, 3)));
    void Print(Stream stream = kOutput);

    std::string_view View() const { return text_; }
    size_t Length() const { return text_.size(); }
    bool Empty() const { return text_.empty(); }

private:
    std::string text_;
};
