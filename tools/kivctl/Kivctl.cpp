#include "Kivctl.h"

#include <SimulatedDevice.h>

#include <algorithm>
#include <cstdio>

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
    {1, Exit::NoBus, "the system bus can not be reached", "DBUS_SYSTEM_BUS_ADDRESS has to name one that runs"},
    {2, Exit::No, "no reply from the service", "it has to run on this bus (kivctl services)"},
    {3, Exit::BusTimedOut, "reaching the system bus timed out", "DBUS_SYSTEM_BUS_ADDRESS has to name a bus that answers"},
    {4, Exit::Refused, "the library refuses an argument", "its log says which"},
    {5, Exit::NoService, "the service can not be addressed", "its log says why"},
};

CodeMeaning Find(int code)
{
    for (const CodeMeaning& meaning : kCodeMeanings)
    {
        if (meaning.code == code)
            return meaning;
    }
    return {code, Exit::No, "a result code without a meaning", "the log may tell more"};
}

} // namespace

void RequireSuccess(int code, const std::vector<std::string>& log)
{
    if (code == 0)
        return;
    const CodeMeaning meaning = Find(code);
    std::string text = std::string(meaning.meaning) + "; " + meaning.remedy;
    for (const std::string& line : log)
        text += "\n  " + line;
    throw Failure(meaning.exit, text);
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

bool IsProfileName(const std::string& device)
{
    const auto profiles = kiv::sim::ListProfiles();
    return device.empty() || std::any_of(profiles.begin(), profiles.end(),
                                 [&device](const kiv::sim::Profile& profile) { return profile.name == device; });
}

void Note(const std::string& text)
{
    std::fprintf(stderr, "kivctl: %s\n", text.c_str());
}
