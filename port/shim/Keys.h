// SPDX-License-Identifier: Apache-2.0
// Interfaces that are asked by numbered keys.
#ifndef PORT_SHIM_KEYS_H
#define PORT_SHIM_KEYS_H

#include <cstddef>
#include <cstring>

#include "Refusal.h"

namespace port {

// A key and what reads it; no device of the port has what a key without a reader stands for.
template <typename T>
struct KeyRow {
    int key;
    coresystem_port::Question question{};
    Result<Sourced<T>> (*read)() = nullptr;
};

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

// Of a call that asks for the key of a row; null when there is no such key.
template <typename Row>
Refusal refusalOf(const char* call, const Row* row)
{
    return row != nullptr && row->read != nullptr ? Refusal{call, {row->question}} : Refusal{call};
}

// Reads a key of the type that the rows have; one of another type is as wrong as an unknown one.
template <typename Enumeration, typename Row, std::size_t Size, typename Slot>
int readKey(const Row (&rows)[Size], const Enumeration& key, Slot* slot, const Codes& codes)
{
    const Row* const row = findKey(rows, numberOf(key));
    if (row == nullptr || slot == nullptr)
        return TIZEN_ERROR_INVALID_PARAMETER;
    if (row->read == nullptr)
        return codes.notSupported;
    return guarded([&] { return handOut(row->question, row->read(), slot, codes); }, codes.failed);
}

} // namespace port

#endif
