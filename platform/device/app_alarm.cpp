#include "app_alarm.h"

#include "Calls.h"

#include <ctime>

using namespace kiv::platform;

static_assert(
    sizeof(time_t) == sizeof(std::int64_t), "compile with -D_TIME_BITS=64: a device file gives times up to the year 9999");

PLATFORM_API int alarm_get_current_time(struct tm* date)
{
    return Answer(Call::alarm_get_current_time, {},
        [&](State& state)
        {
            if (date == nullptr)
                return -EINVAL;
            const time_t now = state.device.currentTime ? static_cast<time_t>(*state.device.currentTime) : time(nullptr);
            return localtime_r(&now, date) ? 0 : -EOVERFLOW;
        });
}
