#include "DAUtil.h"

DAUtil* DAUtil::GetInstance()
{
    static DAUtil instance;
    return &instance;
}

std::string DAUtil::intToStr(int value)
{
    return std::to_string(value);
}
