#include "LoopThread.h"

#include "Notifier.h"

#include <utility>

namespace kiv::platform
{

std::shared_ptr<LoopThread> LoopThread::Start(std::function<void()> setUp, std::function<void()> tearDown)
{
    const auto loop = std::make_shared<LoopThread>();
    loop->thread_ = std::thread(
        [loop, setUp = std::move(setUp), tearDown = std::move(tearDown)]
        {
            g_main_context_push_thread_default(loop->context_.get());
            setUp();
            while (!loop->ended_)
                g_main_context_iteration(loop->context_.get(), TRUE);
            tearDown();
            while (g_main_context_iteration(loop->context_.get(), FALSE)) // what was cancelled comes to its end
                continue;
            g_main_context_pop_thread_default(loop->context_.get());
        });
    return loop;
}

void LoopThread::End()
{
    if (!IsHere())
    {
        new std::thread(std::move(thread_)); // which nobody can wait for
        return;
    }
    ended_ = true;
    g_main_context_wakeup(context_.get());
    if (Notifier::IsDelivering()) // perhaps on that very thread
        thread_.detach();
    else
        thread_.join();
}

void LoopThread::Invoke(std::function<void()> work)
{
    using Work = std::function<void()>;
    const auto run = [](gpointer held)
    {
        (*static_cast<Work*>(held))();
        return G_SOURCE_REMOVE;
    };
    const auto release = [](gpointer held) { delete static_cast<Work*>(held); };
    g_main_context_invoke_full(context_.get(), G_PRIORITY_DEFAULT, run, new Work(std::move(work)), release);
}

} // namespace kiv::platform
