#ifndef PROGRESS_H
#define PROGRESS_H

#include <string>

/// What long work is about, on one line of standard error that is written over; nothing where that is no terminal.
class Progress
{
public:
    Progress() = default;
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;
    ~Progress() { Show(""); }

    /// @param text  what is under way; empty clears the line, for whatever comes next
    void Show(const std::string& text) const;
};

#endif
