// SPDX-License-Identifier: Apache-2.0
#include "FakeBackend.h"

namespace {

FakeBackend* current = nullptr;

} // namespace

// The linker sends every call of port::backend() here.
port::Backend& wrappedBackend() __asm__("__wrap__ZN4port7backendEv");
port::Backend& wrappedBackend()
{
    return *current;
}

FakedBackend::FakedBackend()
{
    current = this;
}

FakedBackend::~FakedBackend()
{
    current = nullptr;
}
