#include "LoopThread.h"

#include "Notifier.h"

#include <utility>

namespace kiv::platform
{

std::shared_ptr<LoopThread> LoopThread::Start(Work work)
{
    auto loop = std::make_shared<LoopThread>();
    loop->thread_ = std::thread(
        [loop, work = std::move(work)]
        {
            g_main_context_push_thread_default(loop->context_.get());
            work.setUp();
            while (!loop->ended_)
                g_main_context_iteration(loop->context_.get(), TRUE);
            work.tearDown();
            while (g_main_context_iteration(loop->context_.get(), FALSE)) // lets cancelled operations end
                continue;
            g_main_context_pop_thread_default(loop->context_.get());
        });
    return loop;
}

void LoopThread::End()
{
    if (!IsHere())
    {
        new std::thread(std::move(thread_)); // never deleted, because this process has no such thread to wait for
        return;
    }
    ended_ = true;
    g_main_context_wakeup(context_.get());
    if (Notifier::IsDelivering()) // perhaps on the same thread
        thread_.detach();
    else
        thread_.join();
}

} // namespace kiv::platform
