#ifndef KIVCTL_H
#define KIVCTL_H

#include "Output.h"

#include <cstdlib>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

/// Exit codes, the same for every verb and from version to version; --help lists them.
enum class Exit : int
{
    Done = 0,
    No = 1,
    Usage = 2,
    TimeUp = 3,
    Refused = 4,
    NoService = 5,
    NoStore = 6,
    NoBus = 8,
    BusTimedOut = 9,
    BadDevice = 10
};

/// What ends a verb early: the exit code, and a text that says what was wrong and what would be right.
class Failure : public std::runtime_error
{
public:
    Failure(Exit code, const std::string& text) : std::runtime_error(text), exit(code) {}

    const Exit exit;
};

/// Whether a verb asks the device, which has to be in order then.
enum class DeviceUse
{
    Asks,
    Leaves
};

/// What the command line asks for.
struct Command
{
    Form form = Form::Text;
    Identifiers identifiers = Identifiers::Masked;
    std::string profile; ///< name or file of the device; empty for that of the environment
    DeviceUse deviceUse = DeviceUse::Asks;
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

/// A diagnostic line on standard error.
void Note(const std::string& text);

#endif
