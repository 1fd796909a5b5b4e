// The info string of xa_open: fields KEY=value joined by '+', in any order, keys in any case. A leading word without '='
// is passed over.
//
//   Acc=P/user/password   who logs on; without it the operating-system user
//   DB=name               by which the connection's handles are found
//   SqlNet=word           the server word of the logon; without it the DB name is that
//   SesTm=seconds         how long a branch may rest before it is rolled back; 0 or none: for ever
//   Threads=true|false    whether each thread opens for itself, or the first one for all
//   MaxCur=n, LogDir=dir  taken, of no effect here
#pragma once

#include <chrono>
#include <string>
#include <string_view>

#include "engine/engine.h"

namespace xa {

struct Info {
    engine::Credentials credentials{{}, {}, true};
    std::string name;
    std::string server;
    std::chrono::seconds session_timeout{0};
    bool threads = false;
};

// False for an unknown field, one that stands twice, and a value that is not well formed.
bool ReadInfo(std::string_view text, Info& info);

}  // namespace xa
