// Where the program lies. Any thread.
#pragma once

#include <unistd.h>

#include <climits>
#include <string>
#include <string_view>

// "." where the system does not tell.
inline std::string ExecutableDirectory() {
    char path[PATH_MAX];
    const ssize_t length = readlink("/proc/self/exe", path, sizeof path);
    if (length <= 0) return ".";
    const std::string_view whole(path, static_cast<std::size_t>(length));
    return std::string(whole.substr(0, whole.rfind('/')));
}
