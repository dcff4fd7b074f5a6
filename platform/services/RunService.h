#ifndef RUNSERVICE_H
#define RUNSERVICE_H

#include "BusParty.h"

#include <functional>
#include <memory>

namespace kiv
{

/// The main() of a program that is one bus service: starts it, tells on standard output that it is ready, serves until SIGINT or
/// SIGTERM, or until it has nothing more to do.
/// @param options  of the command line, ended by an empty one; may be null
/// @param start    makes the service once the command line is read; may throw std::exception
/// @return the exit code: 0, or 1 after a message on standard error
int RunService(int argc, char** argv, const char* summary, const GOptionEntry* options,
    const std::function<std::unique_ptr<BusParty>()>& start) noexcept;

} // namespace kiv

#endif
