#ifndef PROGRESS_H
#define PROGRESS_H

#include <string>

/// Shows the progress of long work on one line of standard error, which is overwritten. Does nothing when that is no terminal.
class Progress
{
public:
    Progress() = default;
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;
    ~Progress() { Show(""); }

    /// @param text  the current step; empty clears the line
    void Show(const std::string& text) const;
};

#endif
