// SPDX-License-Identifier: Apache-2.0
#include "OwnFile.h"

#include <climits>
#include <cstdlib>

#include <dlfcn.h>
#include <link.h>

namespace {

struct Path {
    char text[PATH_MAX] = "";
};

// A relative name counts from the current folder, so it must be resolved while that is the
// loader's.
Path findOwnFile()
{
    static const char here = 0;
    Path path;
    Dl_info self = {};
    void* loaded = nullptr;
    const char* name = "";
    if (dladdr1(&here, &self, &loaded, RTLD_DL_LINKMAP) != 0 && loaded != nullptr)
        name = static_cast<const link_map*>(loaded)->l_name;
    if (*name == '\0') // a program knows no path of itself
        name = "/proc/self/exe";
    if (realpath(name, path.text) == nullptr)
        path.text[0] = '\0';
    return path;
}

const Path& path()
{
    static const Path found = findOwnFile();
    return found;
}

[[gnu::constructor]] void findWhileLoading()
{
    path();
}

} // namespace

const char* port::ownFile()
{
    return path().text;
}
