#ifndef KIV_TESTS_DELIVERIES_H
#define KIV_TESTS_DELIVERIES_H

#include "support/Test.h"

#include <LogControl.h>

namespace kiv::test
{

/// Iterates a main context until a condition holds; fails after twenty seconds.
template <class Condition>
void IterateUntil(Condition isMet, GMainContext* context = nullptr)
{
    const gint64 deadline = g_get_monotonic_time() + 20 * G_TIME_SPAN_SECOND;
    while (!isMet())
    {
        ASSERT_LT(g_get_monotonic_time(), deadline);
        if (!g_main_context_iteration(context, FALSE))
            g_usleep(1000); // for conditions outside the loop
    }
}

/// Counts deliveries of push messages by the library's log lines.
class Deliveries
{
public:
    Deliveries()
    {
        platform::SetLogSink(
            [this](const platform::LogLine& line)
            {
                const auto has = [&](const char* text) { return line.text.find(text) != std::string::npos; };
                open_ += has("DeliverPushMessage(") && has("] interface: ");
                open_ -= has("DeliverPushMessage(") && has("] Unable to create proxy: ");
                open_ -= has("free_user_data(") && has("] end");
            });
    }
    Deliveries(const Deliveries&) = delete;
    Deliveries& operator=(const Deliveries&) = delete;
    ~Deliveries() { platform::SetLogSink(nullptr); }

    /// Whether all started deliveries have ended.
    bool HaveEnded() const { return open_ == 0; }

    /// Iterates a main context until all have ended and nothing of GDBus is left in it.
    void Settle(GMainContext* context = nullptr) const
    {
        IterateUntil([this] { return HaveEnded(); }, context);
        while (g_main_context_iteration(context, FALSE))
            continue;
    }

private:
    std::atomic<int> open_{0};
};

} // namespace kiv::test

#endif
