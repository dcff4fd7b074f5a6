#include "dlog.h"

#include "Locked.h"
#include "LogControl.h"
#include "Report.h"
#include "Visible.h"

#include <glib.h>
#include <syslog.h>

#include <algorithm>
#include <atomic>
#include <cstdarg>
#include <cstdio>
#include <memory>
#include <mutex>
#include <utility>

namespace
{

using kiv::platform::LogLine;
using Sink = std::function<void(const LogLine&)>;

constexpr int kNobody = DLOG_FATAL + 1;

/// Lines with a lower priority than this number are not formatted, because they are not needed.
constexpr int kNotSettled = -1;
std::atomic<int> wantedFrom{kNotSettled};

struct Log
{
    std::mutex mutex;
    int printedFrom = kNobody;
    bool goesToJournal = false; // instead of standard error
    bool keeping = false;
    std::vector<LogLine> kept;
    std::shared_ptr<const Sink> sink;

    Log()
    {
        const char* const wish = g_getenv("KIV_LOG");
        if (g_strcmp0(wish, "error") == 0)
            printedFrom = DLOG_ERROR;
        else if (g_strcmp0(wish, "info") == 0)
            printedFrom = DLOG_INFO;
        else if (g_strcmp0(wish, "journal") == 0)
            printedFrom = DLOG_VERBOSE;
        else if (wish != nullptr && *wish != '\0')
            kiv::platform::Report(std::string("KIV_LOG: \"") + wish + "\" is invalid; expected error, info or journal");
        goesToJournal = printedFrom == DLOG_VERBOSE;
        Settle();
    }

    void Settle() { wantedFrom = keeping || sink ? DLOG_VERBOSE : printedFrom; }
};

/// Never destroyed: threads may log while the process exits.
Log& TheLog()
{
    static Log* const log = new Log;
    return *log;
}

void Print(const LogLine& line)
{
    constexpr const char* kLetters = "??VDIWEF";
    const std::unique_ptr<GDateTime, decltype(&g_date_time_unref)> now(g_date_time_new_now_local(), g_date_time_unref);
    const std::unique_ptr<char, decltype(&g_free)> time(
        now != nullptr ? g_date_time_format(now.get(), "%H:%M:%S.%f") : nullptr, g_free);
    const char letter = line.priority >= DLOG_VERBOSE && line.priority <= DLOG_FATAL ? kLetters[line.priority] : '?';
    const std::string text = kiv::platform::Visible(line.text.substr(0, line.text.find_last_not_of('\n') + 1)) + '\n';
    const std::string whole = std::string(time != nullptr ? time.get() : "") + ' ' + letter + ' ' + line.tag + ": " + text;
    fputs(whole.c_str(), stderr);
}

void SendToJournal(const LogLine& line)
{
    constexpr int kPriorities[] = {LOG_DEBUG, LOG_DEBUG, LOG_INFO, LOG_WARNING, LOG_ERR, LOG_CRIT}; // from DLOG_VERBOSE on
    const int level = std::clamp<int>(line.priority, DLOG_VERBOSE, DLOG_FATAL) - DLOG_VERBOSE;
    syslog(LOG_USER | kPriorities[level], "%s: %s", line.tag.c_str(), line.text.c_str());
}

void Distribute(const LogLine& line)
{
    std::shared_ptr<const Sink> sink;
    void (*print)(const LogLine&) = nullptr;
    {
        const kiv::platform::Locked log(TheLog());
        if (log->keeping)
            log->kept.push_back(line);
        sink = log->sink;
        if (line.priority >= log->printedFrom)
            print = log->goesToJournal ? SendToJournal : Print;
    }
    if (sink)
        (*sink)(line);
    if (print != nullptr)
        print(line);
}

} // namespace

namespace kiv::platform
{

void SettleLog()
{
    TheLog();
}

void StartLog()
{
    const Locked log(TheLog());
    log->kept.clear();
    log->keeping = true;
    log->Settle();
}

std::vector<LogLine> TakeLog()
{
    return std::exchange(Locked(TheLog())->kept, {});
}

void StopLog()
{
    const Locked log(TheLog());
    log->keeping = false;
    log->Settle();
}

void SetLogSink(std::function<void(const LogLine&)> sink)
{
    const Locked log(TheLog());
    log->sink = sink ? std::make_shared<const Sink>(std::move(sink)) : nullptr;
    log->Settle();
}

} // namespace kiv::platform

extern "C" __attribute__((visibility("default"))) int __dlog_print(log_id_t log_id, int prio, const char* tag, const char* fmt, ...)
try
{
    if (wantedFrom.load(std::memory_order_relaxed) == kNotSettled)
        TheLog();
    if (prio < wantedFrom.load(std::memory_order_relaxed))
        return 0;

    va_list arguments;
    va_start(arguments, fmt);
    const std::unique_ptr<char, decltype(&g_free)> text(g_strdup_vprintf(fmt, arguments), g_free);
    va_end(arguments);

    const LogLine line{log_id, prio, tag != nullptr ? tag : "", text != nullptr ? text.get() : ""};
    Distribute(line);
    return static_cast<int>(line.text.size());
}
catch (...)
{
    return -1;
}
