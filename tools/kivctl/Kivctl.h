#ifndef KIVCTL_H
#define KIVCTL_H

#include "Output.h"

#include <cstdlib>
#include <functional>
#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

namespace CLI
{
class App;
}

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

/// The meaning of an exit code.
struct ExitMeaning
{
    Exit code;
    const char* meaning;
};

inline constexpr ExitMeaning kExitMeanings[] = {
    {Exit::Done, "done; the answer is yes"},
    {Exit::No, "no; not found; not delivered; no reply; a check failed"},
    {Exit::Usage, "wrong usage"},
    {Exit::TimeUp, "timed out"},
    {Exit::Refused, "the library rejected an argument"},
    {Exit::NoService, "the service cannot be addressed"},
    {Exit::NoStore, "the subscriber store cannot be used"},
    {Exit::NotWritten, "the output cannot be written"},
    {Exit::NoBus, "the system bus cannot be reached"},
    {Exit::BusTimedOut, "connecting to the system bus timed out"},
    {Exit::BadDevice, "the device file is wrong"},
};

/// An environment variable that the program uses.
struct Variable
{
    const char* name;
    const char* meaning;
};

inline constexpr Variable kEnvironment[] = {
    {"DBUS_SYSTEM_BUS_ADDRESS", "address of the system bus"},
    {"KIV_SUBSCRIBERS", "file of the subscriber store"},
    {"KIV_PROFILE", "device to use without --profile"},
    {"KIV_LOG", "\"error\" or \"info\" prints the platform log to standard error, \"journal\" sends it to the system log"},
    {"NO_COLOR", "when not empty, --color auto uses no colour"},
};

/// Ends a verb early, with an exit code and a message that says what was wrong and what is expected. The message may have more
/// lines.
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

/// Whether a verb uses the device. If so, the device must be usable.
enum class DeviceUse
{
    Asks,
    Leaves
};

/// The result of reading the command line.
struct Command
{
    Form form;
    Identifiers identifiers = Identifiers::Masked;
    std::string profile; ///< name or file of the device; empty to use KIV_PROFILE
    DeviceUse deviceUse = DeviceUse::Asks;
    std::function<Exit()> verb; ///< may throw Failure, kiv::BusError

    /// For each query, the names of the fields that its records may have. The other verbs print no records.
    std::map<const CLI::App*, std::vector<std::string>> fields;
};

/// Frees a text that the library allocated with malloc().
struct Freed
{
    void operator()(char* text) const { std::free(text); }
};
using LibraryText = std::unique_ptr<char, Freed>;

/// Ends the verb when a result code of DADBusManager is not 0.
/// @param log  error lines that the library wrote during the call; printed below the failure
void RequireSuccess(int code, const std::vector<std::string>& log);

/// Describes a result code of DADBusManager in a few words.
std::string MeaningOf(int code);

/// The device that the command line or the environment selects; empty for the default.
std::string DeviceAskedFor(const Command& command);

/// Selects that device. The command line takes precedence over the environment.
/// @return what is wrong with it and what is expected; empty on success
std::string UseDevice(const Command& command);

/// Like UseDevice(), but ends the verb when the device is unusable.
void RequireDevice(const Command& command);

/// Names of the profiles, and of the machine itself.
std::vector<std::string> ProfileNames();

/// Whether `device` is a name and not a file. The device of a profile never changes.
bool IsProfileName(const std::string& device);

/// The word for a value of a platform enumeration. The platform may return values that have no name.
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

/// Whether `device` is the machine itself.
bool IsHost(const std::string& device);

/// Prints a diagnostic to standard error: one line, and one for each detail. Escapes line ends and control characters in them.
void Note(const std::string& text, const std::vector<std::string>& details = {});

#endif
