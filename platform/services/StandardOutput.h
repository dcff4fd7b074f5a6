#ifndef STANDARDOUTPUT_H
#define STANDARDOUTPUT_H

#include <string>

/// @file
/// Writes to standard output and remembers the first error. Any thread.

namespace kiv::StandardOutput
{

/// Writes a text and flushes it.
void Write(const std::string& text);

/// The errno of the first failed write of the process; 0 when there was none.
int Error();

/// Ends a stream of lines. A reader that has closed the stream is not an error.
void EndStream();

} // namespace kiv::StandardOutput

#endif
