#ifndef LIBRARYLOG_H
#define LIBRARYLOG_H

#include <functional>
#include <string>
#include <vector>

/// One line that the library wrote to the platform log, taken apart.
struct LibraryLine
{
    enum class Level
    {
        Info,
        Error
    };

    Level level;
    std::string function; ///< bare name of the member that wrote it
    std::string message;
};

/// Listens to the platform log as long as it lives. What became of a call to a subscriber stands nowhere else: the library tells
/// its caller of none.
/// One object at a time.
class LibraryLog
{
public:
    using Listener = std::function<void(const LibraryLine&)>;

    /// @param listener  hears every line of the library, on the thread that writes it; may be empty
    explicit LibraryLog(Listener listener = nullptr);
    LibraryLog(const LibraryLog&) = delete;
    LibraryLog& operator=(const LibraryLog&) = delete;
    ~LibraryLog();

    /// Messages of the library's error lines so far.
    const std::vector<std::string>& Errors() const { return errors_; }

    /// Ends the verb when the subscriber store could not be asked.
    void RequireStore() const;

private:
    Listener listener_;
    std::vector<std::string> errors_;
    std::string storeTrouble_;
};

#endif
