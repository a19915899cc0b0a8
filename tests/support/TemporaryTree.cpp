// SPDX-License-Identifier: Apache-2.0
#include "support/TemporaryTree.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <stdexcept>

namespace fs = std::filesystem;

TemporaryTree::TemporaryTree()
    : root_((fs::temp_directory_path() / "coresystem-test-XXXXXX").string())
{
    if (mkdtemp(root_.data()) == nullptr)
        throw std::runtime_error("no temporary folder " + root_);
    // Daemons and tests that drop their rights look into it too.
    fs::permissions(root_, fs::perms(0755));
}

TemporaryTree::~TemporaryTree()
{
    std::error_code ignored;
    fs::remove_all(root_, ignored);
}

std::string TemporaryTree::write(const std::string& name, const std::string& content) const
{
    fs::create_directories(fs::path(path(name)).parent_path());
    std::ofstream file(path(name), std::ios::binary | std::ios::trunc);
    file << content;
    if (!file.flush())
        throw std::runtime_error("cannot write " + path(name));
    return path(name);
}

void TemporaryTree::remove(const std::string& name) const
{
    fs::remove_all(path(name));
}
