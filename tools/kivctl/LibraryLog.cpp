#include "LibraryLog.h"

#include "Kivctl.h"

#include <LogControl.h>
#include <dlog.h>

#include <optional>
#include <string_view>
#include <utility>

namespace
{

/// "File.cpp: Function(12) > [*Error*] message\n"
std::optional<LibraryLine> Parse(std::string_view text)
{
    constexpr std::string_view kError = ") > [*Error*] ";
    constexpr std::string_view kInfo = ") > [*Info*] ";
    const size_t name = text.find(": ");
    const size_t nameEnd = text.find('(', name == text.npos ? text.size() : name);
    if (nameEnd == text.npos)
        return std::nullopt;
    const size_t error = text.find(kError, nameEnd);
    const size_t info = text.find(kInfo, nameEnd);
    if (error == text.npos && info == text.npos)
        return std::nullopt;

    const bool isError = error < info;
    const size_t message = isError ? error + kError.size() : info + kInfo.size();
    return LibraryLine{isError ? LibraryLine::Level::Error : LibraryLine::Level::Info,
        std::string(text.substr(name + 2, nameEnd - name - 2)), std::string(text.substr(message, text.rfind('\n') - message))};
}

} // namespace

LibraryLog::LibraryLog(Listener listener) : listener_(std::move(listener))
{
    kiv::platform::SetLogSink(
        [this](const kiv::platform::LogLine& line)
        {
            const bool isError = line.priority >= DLOG_ERROR;
            if (line.tag == "KIV_UTIL" && isError)
                storeTrouble_ = line.text.substr(0, line.text.find('\n'));
            const auto parsed = line.tag == "KIV_AGENT" ? Parse(line.text) : std::nullopt;
            if (!parsed)
                return;
            if (isError)
                errors_.push_back(parsed->message);
            if (listener_)
                listener_(*parsed);
        });
}

LibraryLog::~LibraryLog()
{
    kiv::platform::SetLogSink(nullptr);
}

void LibraryLog::RequireStore() const
{
    if (!storeTrouble_.empty())
        throw Failure(Exit::NoStore, "the subscriber store cannot be used: " + storeTrouble_);
}
