// Timers on the std-only tick loop: periodic and one-shot ticks, restarts, and handlers that drop
// their own timer.
#include "qzivi/support/failure.h"
#include "qzivi/support/timers.h"

#include <gtest/gtest.h>

namespace qzivi {
namespace {

class TimerTest : public ::testing::Test {
protected:
    TimerLoop loop_;
    TickSourceScope source_{&loop_};
};

TEST_F(TimerTest, PeriodicTicksStartWhenBothIntervalAndEnabledAreSet) {
    auto timer = CTimer::Create();
    int ticks = 0;
    auto c = timer->Timer.Connect([&] { ++ticks; });
    timer->Enabled(true);
    loop_.Advance(2000);
    EXPECT_EQ(ticks, 0) << "no interval, no timer";
    timer->Interval(500);
    loop_.Advance(1999);
    EXPECT_EQ(ticks, 3);
    timer->Interval(300); // restarts the period at once
    loop_.Advance(299);
    EXPECT_EQ(ticks, 3);
    loop_.Advance(1);
    EXPECT_EQ(ticks, 4);
    timer->Enabled(false);
    loop_.Advance(5000);
    EXPECT_EQ(ticks, 4);
    EXPECT_EQ(timer->TimerID(), 0u);
}

TEST_F(TimerTest, AOneShotFiresOnceAndItsHandlerMayDropIt) {
    auto timer = CTimer::Create();
    int ticks = 0;
    auto c = timer->Timer.Connect([&] {
        ++ticks;
        timer.reset(); // the last reference of its user goes inside the handler
    });
    timer->OneShot(1);
    loop_.Advance(10);
    EXPECT_EQ(ticks, 1);
    EXPECT_EQ(timer, nullptr);
    EXPECT_EQ(loop_.Count(), 0u);
    EXPECT_EQ(MTimer::RunningCount(), 0u);
}

TEST_F(TimerTest, ARunningTimerOutlivesItsUsersReference) {
    int ticks = 0;
    Connection handler;
    std::weak_ptr<CTimer> watch;
    {
        auto timer = CTimer::Create();
        timer->Interval(100);
        timer->Enabled(true);
        handler = timer->Timer.Connect([&] { ++ticks; });
        watch = timer;
    }
    loop_.Advance(250);
    EXPECT_EQ(ticks, 2) << "the collection keeps it running";
    ASSERT_FALSE(watch.expired());
    watch.lock()->Enabled(false); // it must be disabled to end
    EXPECT_TRUE(watch.expired());
    EXPECT_EQ(MTimer::RunningCount(), 0u);
}

TEST_F(TimerTest, ATickWithAnUnknownIdKillsThatTimer) {
    const std::uint32_t stray = loop_.SetTimer(10);
    EXPECT_EQ(loop_.Count(), 1u);
    loop_.Fire(stray);
    EXPECT_EQ(loop_.Count(), 0u);
}

TEST_F(TimerTest, AFailingHandlerNeverReachesTheLoop) {
    auto timer = CTimer::Create();
    int ticks = 0;
    auto c = timer->Timer.Connect([&] {
        ++ticks;
        throw Failure(-1, "handler", "broken");
    });
    timer->Interval(10);
    timer->Enabled(true);
    EXPECT_NO_THROW(loop_.Advance(30));
    EXPECT_EQ(ticks, 3);
    timer->Enabled(false);
}

// A source that has no timers to give.
class EmptySource : public ITickSource {
public:
    std::uint32_t SetTimer(std::uint32_t) override { return 0; }
    void KillTimer(std::uint32_t) override {}
};

TEST(Timers, NoTimerLeftIsAFailureAndChangesNothingElse) {
    EmptySource empty;
    const TickSourceScope scope(&empty);
    auto timer = CTimer::Create();
    try {
        timer->OneShot(5);
        FAIL();
    } catch (const Failure& f) {
        EXPECT_EQ(static_cast<std::uint32_t>(f.Number()), 0x80047925u);
        EXPECT_EQ(f.Description(), "No timers available");
    }
    EXPECT_EQ(timer->TimerID(), 0u);
}

// Scopes put back what they replaced, innermost first, even when a scope is left by a failure.
TEST(Timers, TickSourceScopesRestoreInOrder) {
    ITickSource& outside = TickSource();
    TimerLoop a, b;
    {
        const TickSourceScope first(&a);
        EXPECT_EQ(&TickSource(), &a);
        try {
            const TickSourceScope second(&b);
            EXPECT_EQ(&TickSource(), &b);
            RaiseRuntime(5, "left by a failure");
        } catch (const Failure&) {
        }
        EXPECT_EQ(&TickSource(), &a);
    }
    EXPECT_EQ(&TickSource(), &outside);
}

} // namespace
} // namespace qzivi
