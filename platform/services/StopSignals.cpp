#include "StopSignals.h"

#include <glib-unix.h>

#include <csignal>
#include <cstdio>

namespace kiv
{
namespace
{

constexpr std::array<int, 3> kSignals = {SIGINT, SIGTERM, SIGHUP};

gboolean Note(gpointer signalled)
{
    *static_cast<bool*>(signalled) = true;
    return G_SOURCE_CONTINUE;
}

} // namespace

StopSignals::StopSignals() : previousPipeHandler_(std::signal(SIGPIPE, SIG_IGN))
{
    for (size_t i = 0; i < kSignals.size(); ++i)
        sources_[i] = g_unix_signal_add(kSignals[i], Note, &signalled_);
}

StopSignals::~StopSignals()
{
    for (const unsigned int source : sources_)
        g_source_remove(source);
    std::signal(SIGPIPE, previousPipeHandler_);
}

bool StopSignals::Requested() const
{
    return signalled_ || std::ferror(stdout);
}

void StopSignals::Iterate()
{
    g_main_context_iteration(nullptr, TRUE);
}

} // namespace kiv
