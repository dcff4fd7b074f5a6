#ifndef STOPSIGNALS_H
#define STOPSIGNALS_H

#include <array>

namespace kiv
{

/// Turns SIGINT, SIGTERM and SIGHUP into something that a main loop can ask for, as long as the object lives.
/// A reader of standard output that went away counts as a request to stop too, instead of killing the process with SIGPIPE: what
/// a process has to take back when it ends is taken back then as well.
/// One object at a time, in the thread that iterates the default main context.
class StopSignals
{
public:
    StopSignals();
    StopSignals(const StopSignals&) = delete;
    StopSignals& operator=(const StopSignals&) = delete;
    ~StopSignals();

    /// Iterates the default main context until a request to stop has come, or until `goOn` gives false.
    /// @return whether a request to stop has come
    template <typename GoOn>
    bool IterateWhile(GoOn goOn)
    {
        while (!Requested() && goOn())
            Iterate();
        return Requested();
    }

private:
    bool Requested() const;
    static void Iterate();

    bool signalled_ = false;
    std::array<unsigned int, 3> sources_{};
    void (*previousPipeHandler_)(int);
};

} // namespace kiv

#endif
