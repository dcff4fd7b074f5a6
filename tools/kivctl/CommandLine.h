#ifndef COMMANDLINE_H
#define COMMANDLINE_H

#include "Kivctl.h"

/// Reads the command line.
/// @param command  receives what it asks for; without a verb when everything is done already, as with --help
/// Throws Failure.
void ReadCommandLine(int argc, char** argv, Command& command);

#endif
