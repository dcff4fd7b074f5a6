#include "support/PrivateBus.h"

namespace kiv::test
{

namespace
{

std::atomic<const char*> tolerated = nullptr; // GLib's threads read it

GLogWriterOutput Complain(GLogLevelFlags level, const GLogField* fields, gsize count, gpointer)
{
    if ((level & G_LOG_LEVEL_MASK) <= G_LOG_LEVEL_MESSAGE)
    {
        g_autofree gchar* text = g_log_writer_format_fields(level, fields, count, FALSE);
        const char* const allowed = tolerated;
        if (allowed == nullptr || g_strrstr(text, allowed) == nullptr)
            ADD_FAILURE() << "GLib says: " << text;
    }
    return G_LOG_WRITER_HANDLED;
}

} // namespace

PrivateBus::PrivateBus(std::string configuration) : BusDaemon(std::move(configuration))
{
    [[maybe_unused]] static const bool once = (g_log_set_writer_func(Complain, nullptr, nullptr), true);
}

void PrivateBus::Tolerate(const char* message)
{
    tolerated = message;
}

} // namespace kiv::test
