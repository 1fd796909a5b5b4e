// Conversion of texts between code pages, known by their registered numbers, and the code pages of the process.
//
// 1200 is UTF-16 and 13488 UCS-2, both with the high byte first; 1202 is UTF-16 with the low byte first; 1208 is UTF-8.
// code_page_table.cpp lists the others. Any thread.
#pragma once

#include <cstddef>
#include <cstdint>

constexpr std::uint32_t kCodePageUtf8 = 1208;
constexpr std::uint32_t kCodePageUtf16 = 1202;

enum CodePageResult : int {
    kCodePageDone = 0,
    kCodePageTruncated = static_cast<int>(0x870F00C0),      // a warning: the output area was too short
    kCodePageSubstituted = static_cast<int>(0x870F00BC),    // a warning: a character could not be converted
    kCodePageUnknown = 1,                                   // no such code page
    kCodePageBadArgument = 2,                               // an area is null, or a setting cannot be read
    kCodePageFailed = 3                                     // the converter could not be opened
};

// Converts `input_length` bytes and never writes more than `capacity`; nothing is terminated. An area that is too
// short holds whole characters only. What cannot be converted becomes U+FFFD where the target has it, else a question
// mark; so does a character that the input breaks off. The bytes not read and not written go to the last arguments,
// which may be null; on failure they are all.
int CodePageConvert(std::uint32_t source, std::uint32_t target, const void* input, std::size_t input_length,
                    std::size_t* unused_input, void* output, std::size_t capacity, std::size_t* unused_output);

// The application code page and the one that stands in for it where it is a Unicode one. KELPCI_CODEPAGE tells them,
// "application" or "application,second"; else the character set of the user's locale does, for both. The C locale, a
// locale that is not installed and a character set that has no number here count as UTF-8, of which ASCII is a part. A
// setting that is no pair of known numbers is answered with kCodePageBadArgument or kCodePageUnknown, and the locale
// decides. The process's own locale is left alone.
int GetProcessCodePage(std::uint32_t* first, std::uint32_t* second);
