#include "qzivi/support/wait_cursor.h"

namespace qzivi {

namespace {
WaitCursor::Handler& Current() {
    static WaitCursor::Handler handler;
    return handler;
}
} // namespace

WaitCursor::WaitCursor() {
    if (Current()) Current()(true);
}

WaitCursor::~WaitCursor() {
    if (Current()) Current()(false);
}

WaitCursor::Handler WaitCursor::SetHandler(Handler handler) {
    std::swap(Current(), handler);
    return handler;
}

} // namespace qzivi
