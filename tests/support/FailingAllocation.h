// SPDX-License-Identifier: Apache-2.0
// Allocation failure on request, and a ledger of the C strings that change hands.
//
// Both work under the sanitizers: operator new is replaced in the test program, and the linker
// redirects the program's own calls of `free` and `strdup`.
#ifndef CORESYSTEM_TESTS_SUPPORT_FAILING_ALLOCATION_H
#define CORESYSTEM_TESTS_SUPPORT_FAILING_ALLOCATION_H

#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace fake {

enum class Allocation {
    THROWING, // operator new: throws std::bad_alloc
    NOTHROW,  // operator new(std::nothrow): returns null
    STRDUP    // strdup: returns null
};

// While it lives, one allocation of the calling thread fails: the one after `skipped` others of its
// kind. One at a time per thread; what the fake allocates for itself does not count.
class FailingAllocation {
public:
    explicit FailingAllocation(Allocation kind, int skipped = 0);
    ~FailingAllocation();
    FailingAllocation(const FailingAllocation&) = delete;
    FailingAllocation& operator=(const FailingAllocation&) = delete;

    bool happened() const;
};

// While it lives, allocations of the calling thread neither fail nor enter the ledger.
class AllocationPause {
public:
    AllocationPause();
    ~AllocationPause();
    AllocationPause(const AllocationPause&) = delete;
    AllocationPause& operator=(const AllocationPause&) = delete;
};

// Who allocated which C string, and which of them were freed. Any thread. Addresses are kept
// inverted, so that the ledger never hides a leak from LeakSanitizer.
class Ledger {
public:
    // A malloc copy that counts as the platform's own.
    char* handOut(const std::string& text);

    // Strings that nobody has freed yet, sorted: "platform: TEXT" from handOut(), "copy: TEXT" from
    // strdup().
    std::vector<std::string> live() const;
    // The same for one string; "" for anything else.
    std::string origin(const char* text) const;
    // Frees what nobody has freed yet and tells what it was: for what the library keeps on purpose.
    std::vector<std::string> freeAll();

    void add(const char* text, const char* owner);
    void remove(const void* address);
    void clear();

private:
    mutable std::mutex mutex_;
    std::map<std::uintptr_t, std::string> live_;
};

Ledger& ledger();

} // namespace fake

#endif
