/// @file
#ifndef KIV_DEVICE_LOCKED_H
#define KIV_DEVICE_LOCKED_H

#include <mutex>

namespace kiv::platform
{

/// Gives access to an object with a `mutex`, and holds that while it lives.
template <class Object>
class Locked
{
public:
    explicit Locked(Object& object) : object_(object), lock_(object.mutex) {}
    Object* operator->() const { return &object_; }
    Object& operator*() const { return object_; }

private:
    Object& object_;
    const std::lock_guard<std::mutex> lock_;
};

} // namespace kiv::platform

#endif
