// SPDX-License-Identifier: Apache-2.0
// Allocation failure on request, and a ledger of the C strings that change hands.
//
// Both work under the sanitizers: operator new is replaced in the test program, and the linker
// redirects the program's own calls of `free` and `strdup`.
#ifndef CORESYSTEM_TESTS_SUPPORT_FAILING_ALLOCATION_H
#define CORESYSTEM_TESTS_SUPPORT_FAILING_ALLOCATION_H

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

} // namespace fake

#endif
