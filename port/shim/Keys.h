// SPDX-License-Identifier: Apache-2.0
// Interfaces that are asked by numbered keys.
#ifndef PORT_SHIM_KEYS_H
#define PORT_SHIM_KEYS_H

#include <cstddef>
#include <cstring>

#include "Call.h"

namespace port {

// A key and what reads it; no device of the port has what a key without a reader stands for.
template <typename T>
struct KeyRow {
    int key = 0; // none where the keys are texts
    Question question{};
    Result<Sourced<T>> (*read)() = nullptr;
};

// The row of a plain fact.
template <Question question>
constexpr KeyRow<typename PlainFact<question>::Value> fact(int key = 0)
{
    return {key, question, [] { return backend().get<question>(); }};
}

// A caller may pass a number that the enumeration lacks: it is looked at as the int it is.
template <typename Enumeration>
int numberOf(const Enumeration& key)
{
    int number = 0;
    static_assert(sizeof number == sizeof key, "the platform's enumerations are int-sized");
    std::memcpy(&number, &key, sizeof number);
    return number;
}

template <typename Row, std::size_t Size>
const Row* findKey(const Row (&rows)[Size], int key)
{
    for (const Row& row : rows)
        if (row.key == key)
            return &row;
    return nullptr;
}

// Reads the key of a row of its type; null, one of another type, is as wrong as an unknown one.
template <typename T, typename Slot>
int readKey(const char* call, const KeyRow<T>* row, Slot* slot, const Codes& codes)
{
    const auto read = [&](const Call& entry) {
        return entry.run(slot, [&]() -> int {
            if (row == nullptr || slot == nullptr)
                return codes.invalid;
            if (row->read == nullptr)
                return codes.notSupported;
            return entry.handOut(row->question, row->read(), slot);
        });
    };
    if (row == nullptr || row->read == nullptr)
        return read(Call(call, codes));
    return read(Call(call, codes, {row->question}));
}

} // namespace port

#endif
