// SPDX-License-Identifier: Apache-2.0
// A folder of made-up files that is removed with the object.
#ifndef TESTS_SUPPORT_TEMPORARY_TREE_H
#define TESTS_SUPPORT_TEMPORARY_TREE_H

#include <string>

class TemporaryTree {
public:
    TemporaryTree();
    ~TemporaryTree();
    TemporaryTree(const TemporaryTree&) = delete;
    TemporaryTree& operator=(const TemporaryTree&) = delete;

    const std::string& root() const
    {
        return root_;
    }
    /// The path of a file in the tree; `name` begins with a slash.
    std::string path(const std::string& name) const
    {
        return root_ + name;
    }
    /// Writes a file with its folders, in place when it is there already; returns its path.
    std::string write(const std::string& name, const std::string& content) const;
    void remove(const std::string& name) const;

private:
    std::string root_;
};

#endif
