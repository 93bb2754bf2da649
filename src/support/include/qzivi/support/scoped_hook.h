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

// A flag set for the length of a scope and given back its value on every way out.
class FlagHold {
public:
    explicit FlagHold(bool& flag) : m_rFlag(flag), m_bWas(flag) { flag = true; }
    ~FlagHold() { m_rFlag = m_bWas; }
    FlagHold(const FlagHold&) = delete;
    FlagHold& operator=(const FlagHold&) = delete;

private:
    bool& m_rFlag;
    bool m_bWas;
};

} // namespace qzivi
