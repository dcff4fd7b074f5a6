#include "ServiceManager.h"

#include "BusInterfaces.h"

#include <utility>

namespace kiv
{

ServiceManager::ServiceManager(std::function<void(const BusCall&)> onCall)
    : BusParty(kServiceManagerXml,
          [onCall = std::move(onCall)](const BusCall& call) -> GVariant*
          {
              onCall(call);
              return nullptr;
          })
{
    OwnName(kBusName);
}

} // namespace kiv
