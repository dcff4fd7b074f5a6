// The platform log with KIV_LOG=journal: what would go to the system log is taken here instead.
#include "support/Test.h"

#include <dlog.h>
#include <syslog.h>

namespace
{

std::vector<std::string> lines;

void Take(int priority, const char* format, va_list arguments)
{
    g_autofree char* text = g_strdup_vprintf(format, arguments);
    lines.push_back(std::to_string(priority) + " " + text);
}

} // namespace

extern "C" void syslog(int priority, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    Take(priority, format, arguments);
    va_end(arguments);
}

extern "C" void __syslog_chk(int priority, int /*flag*/, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    Take(priority, format, arguments);
    va_end(arguments);
}

TEST(Journal, ReceivesEveryLineWithItsPriority)
{
    for (const int priority : {DLOG_VERBOSE, DLOG_DEBUG, DLOG_INFO, DLOG_WARN, DLOG_ERROR, DLOG_FATAL})
        __dlog_print(LOG_ID_SYSTEM, priority, "TAG", "%d%%\n", priority);
    const auto line = [](int priority, const char* text) { return std::to_string(LOG_USER | priority) + " TAG: " + text; };
    EXPECT_THAT(lines, testing::ElementsAre(line(LOG_DEBUG, "2%\n"), line(LOG_DEBUG, "3%\n"), line(LOG_INFO, "4%\n"),
                           line(LOG_WARNING, "5%\n"), line(LOG_ERR, "6%\n"), line(LOG_CRIT, "7%\n")));
}
