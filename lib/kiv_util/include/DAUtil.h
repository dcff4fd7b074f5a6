#ifndef DAUTIL_H
#define DAUTIL_H

#include <string>

/// Small text functions.
class __attribute__((visibility("default"))) DAUtil
{
public:
    /// The one instance; never null, lives as long as the process. Any thread.
    static DAUtil* GetInstance();

    /// The decimal form: a minus sign where negative, then the digits, no padding.
    std::string intToStr(int value);
};

#endif
