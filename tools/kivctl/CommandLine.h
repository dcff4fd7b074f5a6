#ifndef COMMANDLINE_H
#define COMMANDLINE_H

#include "Kivctl.h"

/// Reads the command line.
/// @param command  receives the result; without a verb when nothing is left to do, as after --help
/// Throws Failure.
void ReadCommandLine(int argc, char** argv, Command& command);

#endif
