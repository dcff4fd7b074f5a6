#include "storage.h"

#include "Calls.h"

using namespace kiv::platform;

PLATFORM_API int storage_get_internal_memory_size64(struct statvfs* buf)
{
    return Answer(Call::storage_get_internal_memory_size64, {},
        [&](State& state)
        {
            if (buf == nullptr)
                return -EINVAL;
            if (state.source != nullptr)
                state.source->RefreshStorage(state.device);
            *buf = {};
            buf->f_bsize = state.device.blockSize;
            buf->f_bavail = state.device.blocksAvailable;
            return 0;
        });
}
