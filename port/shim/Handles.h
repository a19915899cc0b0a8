// SPDX-License-Identifier: Apache-2.0
// The handles of the platform's C interfaces. A handle is a number in a pointer's clothes, and no
// number is given twice: one that was released, or that is of another kind, is found out and never
// taken for a live one.
#ifndef PORT_SHIM_HANDLES_H
#define PORT_SHIM_HANDLES_H

#include <atomic>
#include <cstdint>
#include <cstring>
#include <map>
#include <mutex>
#include <optional>
#include <type_traits>
#include <utility>

namespace port {

inline std::uintptr_t newHandleNumber()
{
    static std::atomic<std::uintptr_t> last{0};
    return last += alignof(std::uintptr_t); // aligned as a pointer would be
}

/// The live handles of one kind: a handle's type and what each stands for tell the kinds apart. Any
/// thread.
template <typename Handle, typename Content>
class Handles {
    static_assert(std::is_pointer_v<Handle>, "a number takes its place");

public:
    static Handle open(Content content)
    {
        const std::uintptr_t number = newHandleNumber();
        Handle handle{};
        std::memcpy(&handle, &number, sizeof number);
        Registry& all = registry();
        const std::lock_guard<std::mutex> lock(all.mutex);
        all.contents.emplace(number, std::move(content));
        return handle;
    }

    /// The object of a handle; nothing when it is no live handle of this kind.
    static std::optional<Content> find(Handle handle)
    {
        Registry& all = registry();
        const std::lock_guard<std::mutex> lock(all.mutex);
        const auto found = all.contents.find(numberOf(handle));
        return found != all.contents.end() ? std::optional<Content>(found->second) : std::nullopt;
    }

    /// False when it is no live handle of this kind.
    static bool close(Handle handle)
    {
        Registry& all = registry();
        const std::lock_guard<std::mutex> lock(all.mutex);
        return all.contents.erase(numberOf(handle)) != 0;
    }

    static std::size_t live()
    {
        Registry& all = registry();
        const std::lock_guard<std::mutex> lock(all.mutex);
        return all.contents.size();
    }

private:
    struct Registry {
        std::mutex mutex;
        std::map<std::uintptr_t, Content> contents;
    };

    static Registry& registry()
    {
        static Registry& only = *new Registry; // a thread may still ask while the process ends
        return only;
    }

    static std::uintptr_t numberOf(Handle handle)
    {
        std::uintptr_t number = 0;
        std::memcpy(&number, &handle, sizeof number);
        return number;
    }
};

} // namespace port

#endif
