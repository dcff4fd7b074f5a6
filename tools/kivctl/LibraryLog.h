#ifndef LIBRARYLOG_H
#define LIBRARYLOG_H

#include <functional>
#include <string>
#include <vector>

/// The parts of one line that the library wrote to the platform log.
struct LibraryLine
{
    enum class Level
    {
        Info,
        Error
    };

    Level level;
    std::string function; ///< name of the member that wrote it
    std::string message;
};

/// Receives the platform log during its lifetime. Only the log says whether a call to a subscriber succeeded: the library does not
/// return it. One object at a time.
class LibraryLog
{
public:
    using Listener = std::function<void(const LibraryLine&)>;

    /// @param listener  receives every line of the library, on the thread that writes it; may be empty
    explicit LibraryLog(Listener listener = nullptr);
    LibraryLog(const LibraryLog&) = delete;
    LibraryLog& operator=(const LibraryLog&) = delete;
    ~LibraryLog();

    /// Messages of the library's error lines so far.
    const std::vector<std::string>& Errors() const { return errors_; }

    /// Ends the verb when the subscriber store could not be used.
    void RequireStore() const;

private:
    Listener listener_;
    std::vector<std::string> errors_;
    std::string storeTrouble_;
};

#endif
