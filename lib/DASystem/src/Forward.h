/// @file
/// Forwards calls of the facade to a manager.
#ifndef KIV_FORWARD_H
#define KIV_FORWARD_H

#include <utility>

namespace kiv
{

/// Calls a member of a manager with these arguments. Every forward of the facade does this.
/// @param failure  the result when the manager cannot be made
template <class Manager, class Result, class... Parameters, class... Arguments>
Result Ask(Result failure, Result (Manager::*member)(Parameters...), Arguments&&... arguments)
{
    Manager* const manager = Manager::GetInstance();
    return manager == nullptr ? failure : (manager->*member)(std::forward<Arguments>(arguments)...);
}

/// The same for a member without a result.
template <class Manager, class... Parameters, class... Arguments>
void Ask(void (Manager::*member)(Parameters...), Arguments&&... arguments)
{
    if (Manager* const manager = Manager::GetInstance())
        (manager->*member)(std::forward<Arguments>(arguments)...);
}

} // namespace kiv

#endif
