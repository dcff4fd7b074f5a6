#include "Kivctl.h"

#include "Bus.h"
#include "Layout.h"

#include <DeviceControl.h>
#include <ResultCode.h>
#include <SourceControl.h>
#include <Visible.h>

#include <algorithm>
#include <cstdio>
#include <unistd.h>

namespace
{

struct CodeMeaning
{
    int code;
    Exit exit;
    const char* meaning;
    const char* remedy;
};

constexpr CodeMeaning kCodeMeanings[] = {
    {KIV_RESULT_NO_BUS, Exit::NoBus, "the system bus cannot be reached",
        "set DBUS_SYSTEM_BUS_ADDRESS to the address of a running bus"},
    {KIV_RESULT_NO_REPLY, Exit::No, "no reply from the service",
        "start it on this bus (kivctl services); if it runs, see kivctl doctor"},
    {KIV_RESULT_BUS_TIMED_OUT, Exit::BusTimedOut, "connecting to the system bus timed out",
        "set DBUS_SYSTEM_BUS_ADDRESS to the address of a bus that answers"},
    {KIV_RESULT_INVALID_ARGUMENT, Exit::Refused, "the library rejected an argument", "its log says which"},
    {KIV_RESULT_NO_PROXY, Exit::NoService, "the service cannot be addressed", "its log says why"},
};

CodeMeaning Find(int code)
{
    for (const CodeMeaning& meaning : kCodeMeanings)
    {
        if (meaning.code == code)
            return meaning;
    }
    return {code, Exit::No, "unknown result code", "the log may say more"};
}

} // namespace

void RequireSuccess(int code, const std::vector<std::string>& log)
{
    if (code == KIV_RESULT_SUCCESS)
        return;
    const CodeMeaning meaning = Find(code);
    std::vector<std::string> reasons(log.size());
    std::transform(log.begin(), log.end(), reasons.begin(), ReasonOf);
    throw Failure(meaning.exit, std::string(meaning.meaning) + "; " + meaning.remedy, reasons);
}

std::string MeaningOf(int code)
{
    return Find(code).meaning;
}

std::string DeviceAskedFor(const Command& command)
{
    const char* fromEnvironment = std::getenv("KIV_PROFILE");
    return command.profile.empty() && fromEnvironment ? fromEnvironment : command.profile;
}

std::string UseDevice(const Command& command)
{
    return command.profile.empty() ? kiv::platform::DeviceTrouble() : kiv::platform::UseProfile(command.profile);
}

void RequireDevice(const Command& command)
{
    const std::string trouble = UseDevice(command);
    if (!trouble.empty())
        throw Failure(Exit::BadDevice, trouble);
}

std::vector<std::string> ProfileNames()
{
    std::vector<std::string> names;
    for (const kiv::platform::Profile& profile : kiv::platform::ListProfiles())
        names.push_back(profile.name);
    names.push_back(kiv::platform::HostProfile().name);
    return names;
}

bool IsProfileName(const std::string& device)
{
    const std::vector<std::string> names = ProfileNames();
    return device.empty() || std::find(names.begin(), names.end(), device) != names.end();
}

bool IsHost(const std::string& device)
{
    return device == kiv::platform::HostProfile().name;
}

void Note(const std::string& text, const std::vector<std::string>& details)
{
    const auto print = [width = TerminalWidth(STDERR_FILENO)](const std::string& line, size_t indent)
    {
        for (const std::string& piece : Wrapped(line, width, indent))
            std::fprintf(stderr, "%s\n", piece.c_str());
    };
    print("kivctl: " + kiv::platform::Visible(text), 2);
    for (const std::string& detail : details)
        print("  " + kiv::platform::Visible(detail), 4);
}
