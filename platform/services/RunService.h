#ifndef RUNSERVICE_H
#define RUNSERVICE_H

#include "BusParty.h"

#include <functional>
#include <memory>

namespace kiv
{

/// The main() of a program for one bus service: starts the service, prints on standard output that it is ready, and serves until
/// SIGINT, SIGTERM or SIGHUP, the end of its work, or a failure to write its output.
/// @param options  command-line options, ended by an empty one; may be null
/// @param start    makes the service after the command line is read; may throw std::exception
/// @return the exit code: 0, or 1 after a message on standard error
int RunService(int argc, char** argv, const char* summary, const GOptionEntry* options,
    const std::function<std::unique_ptr<BusParty>()>& start) noexcept;

} // namespace kiv

#endif
