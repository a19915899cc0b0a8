// SPDX-License-Identifier: Apache-2.0
#include "Environment.h"

#include <glib.h>
#include <sys/auxv.h>

namespace port::linux_backend {

bool hasMoreRightsThanItsCaller()
{
    return getauxval(AT_SECURE) != 0;
}

std::vector<std::string> configurationFiles()
{
    const std::string file = "/coresystem/vconf.ini";
    std::vector<std::string> files = {"/etc" + file};
    if (!hasMoreRightsThanItsCaller())
        files.insert(files.begin(), g_get_user_config_dir() + file);
    return files;
}

std::string dataFolder()
{
    return hasMoreRightsThanItsCaller() ? "/" : g_get_user_data_dir();
}

} // namespace port::linux_backend
