// SPDX-License-Identifier: Apache-2.0
// Who allocated which C string, and which of them were freed.
#ifndef CORESYSTEM_TESTS_SUPPORT_LEDGER_H
#define CORESYSTEM_TESTS_SUPPORT_LEDGER_H

#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace fake {

// Any thread. Addresses are kept inverted, so that the ledger never hides a leak from
// LeakSanitizer.
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

    void addCopy(const char* text);
    void remove(const void* address);
    void clear();

private:
    void add(const char* text, const char* owner);
    std::vector<std::string> texts() const;

    mutable std::mutex mutex_;
    std::map<std::uintptr_t, std::string> live_;
};

Ledger& ledger();

} // namespace fake

#endif
