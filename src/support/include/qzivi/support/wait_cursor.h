// The wait cursor of long reads. Headless it does nothing; the Qt layer plugs in the busy cursor.
#pragma once

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

} // namespace qzivi
