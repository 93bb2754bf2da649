// The wait cursor of long reads. Headless it does nothing; the Qt layer plugs in the busy cursor.
#pragma once

#include "qzivi/support/scoped_hook.h"

#include <functional>

namespace qzivi {

class WaitCursor {
public:
    using Handler = std::function<void(bool busy)>;
    WaitCursor();
    ~WaitCursor();
    WaitCursor(const WaitCursor&) = delete;
    WaitCursor& operator=(const WaitCursor&) = delete;

    // Called with true when a wait begins and false when it ends; returns the handler it replaces.
    static Handler SetHandler(Handler handler);
};

// The wait cursor's handler for the lifetime of a scope.
using WaitCursorScope = ScopedHook<WaitCursor::Handler, &WaitCursor::SetHandler>;

} // namespace qzivi
