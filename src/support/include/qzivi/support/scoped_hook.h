// A process-wide hook (the message box, the wait cursor, the tick source) set for the lifetime of
// a scope: the hook it replaced is put back at the end, whichever way the scope is left.
#pragma once

#include <utility>

namespace qzivi {

template <typename Hook, Hook (*Set)(Hook)>
class ScopedHook {
public:
    explicit ScopedHook(Hook hook) : previous_(Set(std::move(hook))) {}
    ~ScopedHook() { Set(std::move(previous_)); }
    ScopedHook(const ScopedHook&) = delete;
    ScopedHook& operator=(const ScopedHook&) = delete;

private:
    Hook previous_;
};

} // namespace qzivi
