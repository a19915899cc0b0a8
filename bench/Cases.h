// SPDX-License-Identifier: Apache-2.0
// The measured cases. Each serves two ways: timed by Google Benchmark, and merely repeated, so
// that callgrind can count its instructions.
#ifndef BENCH_CASES_H
#define BENCH_CASES_H

#include <benchmark/benchmark.h>

#include <cstddef>
#include <functional>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace bench {

struct Case {
    std::string name; // "question/key"
    std::function<void(benchmark::State&)> time;
    std::function<void(std::size_t repetitions)> repeat;
    std::size_t fixedIterations; // 0: as many as fill the time
};

inline std::vector<Case>& cases()
{
    static std::vector<Case> all;
    return all;
}

/// Adds a case; `call(i)` does it once, for the i-th key of its round.
template <class Call>
void addCase(std::string name, Call call, std::size_t fixedIterations = 0)
{
    auto time = [call](benchmark::State& state) {
        std::size_t i = 0;
        for (auto _ : state)
            call(i++);
    };
    auto repeat = [call](std::size_t repetitions) {
        for (std::size_t i = 0; i < repetitions; ++i)
            call(i);
    };
    cases().push_back({std::move(name), time, repeat, fixedIterations});
}

/// The keys of one case in the order they are asked; as many as a power of two.
template <class Key>
struct Round {
    std::string name;
    std::vector<Key> keys;

    const Key& operator[](std::size_t i) const
    {
        return keys[i & (keys.size() - 1)];
    }
};

// Enough that the processor cannot learn the order by heart.
constexpr std::size_t RANDOM_KEYS = 8192;
// Whole rounds, so that the count of a call is an exact mean.
constexpr std::size_t COUNTED_CALLS = RANDOM_KEYS;

template <class Key>
std::vector<Key> randomKeys(const std::vector<Key>& rows)
{
    std::mt19937 generator(1); // seeded: every run asks the same
    std::uniform_int_distribution<std::size_t> anyRow(0, rows.size() - 1);
    std::vector<Key> keys;
    for (std::size_t i = 0; i < RANDOM_KEYS; ++i)
        keys.push_back(rows[anyRow(generator)]);
    return keys;
}

/// Random rows, the first row, the last row, and a key that no row has.
template <class Key, class NoMatch>
std::vector<Round<Key>> roundsOf(const std::vector<Key>& rows, NoMatch noMatch)
{
    return {{"random", randomKeys(rows)},
            {"first row", {rows.front()}},
            {"last row", {rows.back()}},
            {"no match", {noMatch}}};
}

/// Adds a case for each round; `call(key)` asks once.
template <class Key, class Call>
void addRounds(const std::string& name, const std::vector<Round<Key>>& rounds, Call call,
               std::size_t fixedIterations = 0)
{
    for (const Round<Key>& round : rounds)
        addCase(
            name + "/" + round.name, [round, call](std::size_t i) { call(round[i]); },
            fixedIterations);
}

/// A column's cells as keys.
template <class Column>
std::vector<const char*> textsOf(const Column& column)
{
    std::vector<const char*> texts;
    for (std::size_t row = 0; row < Column::rows; ++row)
        texts.push_back(column.cells[row]);
    return texts;
}

/// Times every case as Google Benchmark's options say, or with --count repeats each for callgrind.
int runCases(int argc, char** argv);

void addCountryQueries();
void addPeers();
void addSharedParts();

} // namespace bench

#endif
