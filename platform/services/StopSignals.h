#ifndef STOPSIGNALS_H
#define STOPSIGNALS_H

#include <array>

namespace kiv
{

/// Turns SIGINT, SIGTERM and SIGHUP into a request to stop, which a main loop can query, while the object lives.
/// A failure to write to standard output, which its reader may have closed, is such a request too, and SIGPIPE does not kill the
/// process. So the process can always clean up. One object at a time, in the thread that iterates the default main context.
class StopSignals
{
public:
    StopSignals();
    StopSignals(const StopSignals&) = delete;
    StopSignals& operator=(const StopSignals&) = delete;
    ~StopSignals();

    /// Iterates the default main context until there is a request to stop, or `goOn` returns false.
    /// @return whether there was a request to stop
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
