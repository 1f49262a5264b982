// The module file, which the build puts beside the running test program.
#pragma once

#include <unistd.h>

#include <string>

inline std::u16string modulePath() {
    char exe[4096];
    ssize_t length = readlink("/proc/self/exe", exe, sizeof exe);
    std::string path(exe, length > 0 ? static_cast<size_t>(length) : 0);
    path = path.substr(0, path.rfind('/') + 1) + "Hivelet.hzx";
    return std::u16string(path.begin(), path.end());  // build paths are ASCII
}
