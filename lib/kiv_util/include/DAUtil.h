#ifndef DAUTIL_H
#define DAUTIL_H

#include <string>

/// Functions for texts.
class __attribute__((visibility("default"))) DAUtil
{
public:
    /// Returns the one instance, never null, which lives as long as the process. Any thread.
    static DAUtil* GetInstance();

    /// Returns the decimal form: a minus sign if negative, then the digits without padding.
    std::string intToStr(int value);
};

#endif
