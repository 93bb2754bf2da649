// Events: handlers run synchronously, in connection order, on the caller's thread. A connection
// ends with its Connection object; a handler may end its own or another's while the event fires.
#pragma once

#include <functional>
#include <memory>
#include <vector>

namespace qzivi {

class Connection {
public:
    Connection() = default;
    explicit Connection(std::shared_ptr<bool> alive) : alive_(std::move(alive)) {}
    Connection(Connection&&) noexcept = default;
    Connection& operator=(Connection&& other) noexcept {
        if (this != &other) {
            Disconnect();
            alive_ = std::move(other.alive_);
        }
        return *this;
    }
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;
    ~Connection() { Disconnect(); }

    void Disconnect() {
        if (alive_) *alive_ = false;
        alive_.reset();
    }
    bool Connected() const { return alive_ && *alive_; }

private:
    std::shared_ptr<bool> alive_;
};

template <typename... Args>
class Event {
public:
    using Handler = std::function<void(Args...)>;

    [[nodiscard]] Connection Connect(Handler handler) {
        auto slot = std::make_shared<Slot>(Slot{std::move(handler), std::make_shared<bool>(true)});
        slots_.push_back(slot);
        return Connection(slot->alive);
    }

    void operator()(Args... args) const {
        if (slots_.empty()) return;
        // By index, over the handlers there were when it began: a handler may connect more (they
        // wait for the next time) or end connections (they are skipped, and dropped afterwards).
        struct Depth {
            const Event& event;
            explicit Depth(const Event& e) : event(e) { ++event.depth_; }
            ~Depth() {
                if (--event.depth_ == 0) event.Prune();
            }
        } depth(*this);
        const std::size_t count = slots_.size();
        for (std::size_t i = 0; i < count; ++i) {
            const Slot* slot = slots_[i].get();
            if (*slot->alive) slot->handler(args...);
        }
    }

    bool HasHandlers() const {
        for (const auto& slot : slots_)
            if (*slot->alive) return true;
        return false;
    }

private:
    struct Slot {
        Handler handler;
        std::shared_ptr<bool> alive;
    };
    void Prune() const {
        std::erase_if(slots_, [](const std::shared_ptr<Slot>& slot) { return !*slot->alive; });
    }
    mutable std::vector<std::shared_ptr<Slot>> slots_;
    mutable int depth_ = 0;
};

} // namespace qzivi
