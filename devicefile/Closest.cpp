// SPDX-License-Identifier: Apache-2.0
#include "Closest.h"

#include <algorithm>
#include <numeric>

namespace {

// Levenshtein distance.
std::size_t editsBetween(const std::string& from, const std::string& to)
{
    std::vector<std::size_t> row(to.size() + 1);
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 0; i < from.size(); ++i) {
        std::size_t diagonal = row[0]++;
        for (std::size_t j = 0; j < to.size(); ++j) {
            const std::size_t replaced = diagonal + (from[i] == to[j] ? 0 : 1);
            diagonal = row[j + 1];
            row[j + 1] = std::min({replaced, diagonal + 1, row[j] + 1});
        }
    }
    return row.back();
}

} // namespace

std::string port::devicefile::closest(const std::string& word,
                                      const std::vector<std::string>& candidates)
{
    return *std::min_element(candidates.begin(), candidates.end(),
                             [&](const std::string& left, const std::string& right) {
                                 return editsBetween(word, left) < editsBetween(word, right);
                             });
}

std::string port::devicefile::similar(const std::string& word,
                                      const std::vector<std::string>& candidates)
{
    if (candidates.empty())
        return {};
    const std::string found = closest(word, candidates);
    return editsBetween(word, found) <= word.size() / 2 ? found : std::string();
}
