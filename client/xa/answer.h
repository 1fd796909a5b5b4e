// What an XA call answers: its code, and the error number and words behind it for the diagnostics.
#pragma once

#include "handles/status.h"
#include "kelpci.h"

namespace xa {

struct Answer {
    Answer(int its_code) : code(its_code) {}    // by intention: a code that says all
    Answer(int its_code, Status its_status) : code(its_code), status(std::move(its_status)) {}

    int code;
    Status status;
};

// The code that stands for an error number.
int CodeOf(int number);
// The answer to what became of a branch: XA_OK and XA_RDONLY, too.
Answer AnswerOf(Status status);

// Keeps the diagnostics of a resource manager's last call in this thread, and gives the code.
int Note(int rmid, const Answer& answer) noexcept;
// False when this thread has made no call for it.
bool Noted(int rmid, SQLCA& diagnostics);

}  // namespace xa
