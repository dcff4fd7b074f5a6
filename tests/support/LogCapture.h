#ifndef KIV_TESTS_LOGCAPTURE_H
#define KIV_TESTS_LOGCAPTURE_H

#include "support/Test.h"

#include <SimulatedLog.h>
#include <dlog.h>

#include <cstdio>

namespace kiv::test
{

/// The lines that the library logs while this object lives.
class LogCapture
{
public:
    LogCapture() { sim::StartLog(); }
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;
    ~LogCapture() { sim::StopLog(); }

    /// What was logged since the last Take, a text a line: "E DASimManager.cpp IsValidMcc > mcc is invalid". A line that is not in
    /// the form of the library's lines is handed out behind "bad line: ", which no expectation matches.
    std::vector<std::string> Take() { return Take(""); }

    /// The same, error lines alone.
    std::vector<std::string> TakeErrors() { return Take("E "); }

private:
    static std::vector<std::string> Take(const std::string& prefix)
    {
        std::vector<std::string> texts;
        for (const auto& line : sim::TakeLog())
        {
            std::string text = Text(line);
            if (text.compare(0, prefix.size(), prefix) == 0 || text.compare(0, 3, "bad") == 0)
                texts.push_back(std::move(text));
        }
        return texts;
    }

    static std::string Text(const sim::LogLine& line)
    {
        char file[64] = "", function[64] = "", number[12] = "", level[8] = "";
        int size = 0;
        std::sscanf(
            line.text.c_str(), "%63[^:]: %63[A-Za-z0-9_](%11[0-9]) > [*%7[A-Za-z]*]%n", file, function, number, level, &size);
        const std::string message = line.text.substr(static_cast<std::size_t>(size));
        const bool error = line.priority == DLOG_ERROR;
        // What was read, written again, is the line when it had the form to the letter.
        if (line.id != LOG_ID_SYSTEM || line.tag != "KIV_AGENT" || (!error && line.priority != DLOG_INFO) || number[0] < '1' ||
            line.text != std::string(file) + ": " + function + '(' + number + ") > [*" + (error ? "Error" : "Info") + "*] " +
                             message.substr(1, message.size() - 2) + '\n')
            return "bad line: " + std::to_string(line.id) + ' ' + std::to_string(line.priority) + ' ' + line.tag + ' ' + line.text;
        return (error ? "E " : "I ") + std::string(file) + ' ' + function + " >" + message.substr(0, message.size() - 1);
    }
};

} // namespace kiv::test

#endif
