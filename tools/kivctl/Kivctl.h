#ifndef KIVCTL_H
#define KIVCTL_H

#include "Output.h"

#include <cstdlib>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

/// Exit codes, the same for every verb and from version to version.
enum class Exit : int
{
    Done = 0,
    No = 1,
    Usage = 2,
    TimeUp = 3,
    Refused = 4,
    NoService = 5,
    NoStore = 6,
    NotWritten = 7,
    NoBus = 8,
    BusTimedOut = 9,
    BadDevice = 10
};

/// What an exit code tells.
struct ExitMeaning
{
    Exit code;
    const char* meaning;
};

inline constexpr ExitMeaning kExitMeanings[] = {
    {Exit::Done, "done; the answer is yes"},
    {Exit::No, "no, not found, not delivered, no reply, something is not well"},
    {Exit::Usage, "wrong usage"},
    {Exit::TimeUp, "time is up"},
    {Exit::Refused, "the library refuses an argument"},
    {Exit::NoService, "the service can not be addressed"},
    {Exit::NoStore, "the subscriber store can not be used"},
    {Exit::NotWritten, "the output cannot be written"},
    {Exit::NoBus, "the system bus can not be reached"},
    {Exit::BusTimedOut, "reaching the system bus timed out"},
    {Exit::BadDevice, "the device file is wrong"},
};

/// An environment variable that matters.
struct Variable
{
    const char* name;
    const char* meaning;
};

inline constexpr Variable kEnvironment[] = {
    {"DBUS_SYSTEM_BUS_ADDRESS", "the system bus to use"},
    {"KIV_SUBSCRIBERS", "file of the subscriber store"},
    {"KIV_PROFILE", "the device where --profile names none"},
    {"KIV_LOG", "\"error\" or \"info\" shows the platform log on standard error, \"journal\" sends it to the system log"},
    {"NO_COLOR", "when not empty, no colour on a terminal either"},
};

/// What ends a verb early: the exit code, and a text that says what was wrong and what would be right, perhaps with more lines.
class Failure : public std::runtime_error
{
public:
    Failure(Exit code, const std::string& text, std::vector<std::string> moreLines = {})
        : std::runtime_error(text), exit(code), details(std::move(moreLines))
    {
    }

    const Exit exit;
    const std::vector<std::string> details;
};

/// Whether a verb asks the device, which has to be in order then.
enum class DeviceUse
{
    Asks,
    Leaves
};

/// What a verb prints: records that a query returns, of which the command line may choose fields, or what happens.
enum class Prints
{
    Records,
    Events
};

/// What the command line asks for.
struct Command
{
    Form form;
    Identifiers identifiers = Identifiers::Masked;
    std::string profile; ///< name or file of the device; empty for that of the environment
    DeviceUse deviceUse = DeviceUse::Asks;
    Prints prints = Prints::Records;
    std::function<Exit()> verb; ///< may throw Failure, kiv::BusError
};

/// A text that the library handed out with malloc(), free()d with its owner.
struct Freed
{
    void operator()(char* text) const { std::free(text); }
};
using LibraryText = std::unique_ptr<char, Freed>;

/// Ends the verb when the library's result code, one of DADBusManager's, is not 0.
/// @param log  error lines that the library wrote meanwhile; shown below the failure
void RequireSuccess(int code, const std::vector<std::string>& log);

/// What a result code of DADBusManager's means, in a few words.
std::string MeaningOf(int code);

/// The device that the command line or the environment asks for; empty for the default one.
std::string DeviceAskedFor(const Command& command);

/// Makes that device the one to ask: the profile of the command line takes the place of the environment's.
/// @return what is wrong with it and what would be right; empty when nothing is
std::string UseDevice(const Command& command);

/// The same, ending the verb when something is wrong.
void RequireDevice(const Command& command);

/// Names of the profiles that come with the simulated device.
std::vector<std::string> ProfileNames();

/// Whether `device` names a profile that comes with the simulated device, not a file. Such a device never changes.
bool IsProfileName(const std::string& device);

/// The word for a value of an enumeration of the platform, which may give others than it names.
struct Word
{
    int value;
    const char* text;
};

template <size_t N>
std::string WordFor(const Word (&words)[N], int value)
{
    for (const Word& word : words)
    {
        if (word.value == value)
            return word.text;
    }
    return "other (" + std::to_string(value) + ")";
}

/// Whether `device` names the machine itself.
bool IsHost(const std::string& device);

/// A diagnostic on standard error: one line, and one more for each detail. Line ends and control characters in them are escaped.
void Note(const std::string& text, const std::vector<std::string>& details = {});

#endif
