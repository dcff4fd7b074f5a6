#ifndef KIV_TESTS_LOGCAPTURE_H
#define KIV_TESTS_LOGCAPTURE_H

#include "support/Test.h"

#include <LogControl.h>
#include <dlog.h>

namespace kiv::test
{

/// Captures the library's log lines while it lives.
class LogCapture
{
public:
    LogCapture() { platform::StartLog(); }
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;
    ~LogCapture() { platform::StopLog(); }

    /// Returns the lines logged since the last call, as "E DASimManager.cpp IsValidMcc > mcc is invalid". A line that does not have
    /// the library's form starts with "bad line: ", which no expectation matches.
    static std::vector<std::string> Take(const std::string& prefix = "")
    {
        std::vector<std::string> texts;
        for (const auto& line : platform::TakeLog())
        {
            std::string text = Text(line);
            if (text.rfind(prefix, 0) == 0 || text.rfind("bad", 0) == 0)
                texts.push_back(std::move(text));
        }
        return texts;
    }

    static std::vector<std::string> TakeErrors() { return Take("E "); }

private:
    static std::string Text(const platform::LogLine& line)
    {
        constexpr auto kForm = R"(\A((.)\w+) 2 KIV_AGENT ([^:]+): (\w+)\([1-9]\d*\) > \[\*\1\*\] (.*)\n\z)";
        static GRegex* const form =
            g_regex_new(kForm, GRegexCompileFlags(G_REGEX_RAW | G_REGEX_DOTALL | G_REGEX_OPTIMIZE), GRegexMatchFlags(0), nullptr);
        const std::string level = line.priority == DLOG_ERROR ? "Error " : line.priority == DLOG_INFO ? "Info " : "? ";
        const std::string whole = level + std::to_string(line.id) + ' ' + line.tag + ' ' + line.text;
        g_autofree char* text = g_regex_replace(form, whole.c_str(), -1, 0, R"(\2 \3 \4 > \5)", GRegexMatchFlags(0), nullptr);
        return whole == text ? "bad line: " + whole : text;
    }
};

} // namespace kiv::test

#endif
