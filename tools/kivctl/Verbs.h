#ifndef VERBS_H
#define VERBS_H

#include "Kivctl.h"

#include <ctime>
#include <optional>
#include <string>
#include <vector>

/// @file
/// The verbs of kivctl and the options of each. Each group of verbs is in the source file of its name.

/// @name Country.cpp
/// @{
struct CountryOptions
{
    std::string key;
    std::string kind; ///< one of CountryKeyKinds(); empty to guess
};
std::vector<std::string> CountryKeyKinds();
Exit ShowCountry(const CountryOptions& options, const Command& command);
/// @}

/// @name Device.cpp
/// @{
struct DeviceOptions
{
    std::optional<std::string> package;
    double storageMiB = 100;
};
Exit ShowDevice(const DeviceOptions& options, const Command& command);
Exit ShowDeviceId(const Command& command);
/// @}

/// @name DeviceFile.cpp
/// @{
struct DeviceFileOptions
{
    std::vector<std::string> words; ///< GROUP.KEY=VALUE to set, GROUP.KEY to unset
    std::string from;               ///< profile that a new file starts from; empty for the one in use
};
struct DeviceValueOptions
{
    std::string key; ///< empty for all
};
struct ProfileOptions
{
    std::string name;
};
Exit SetInDeviceFile(const DeviceFileOptions& options, const Command& command);
Exit UnsetInDeviceFile(const DeviceFileOptions& options, const Command& command);
Exit ShowDeviceValues(const DeviceValueOptions& options, const Command& command);
Exit ShowDeviceKeys(const Command& command);
Exit ShowProfiles(const Command& command);
Exit ShowProfile(const ProfileOptions& options, const Command& command);
/// @}

/// @name Doctor.cpp
/// @{
Exit Examine(const Command& command);
/// @}

/// @name Sim.cpp, SimWait.cpp
/// @{
struct SimOptions
{
    int slot = -1; ///< all slots when below 0
    std::optional<double> timeout;
};
Exit ShowSims(const SimOptions& options, const Command& command);
Exit WaitForSim(const SimOptions& options, const Command& command);
/// @}

/// @name Network.cpp, Watch.cpp
/// @{
struct NetworkOptions
{
    bool countsWifi = false;
    bool countsBluetooth = false;
};
Exit ShowNetwork(const NetworkOptions& options, const Command& command);
Exit Watch(const Command& command);
/// @}

/// @name Notify.cpp
/// @{
struct NotifyOptions
{
    std::vector<std::string> types; ///< of NotificationTypes()
    std::string to = "subscribers"; ///< or "manager"
    std::string imsi;               ///< empty for that of the first SIM that answers
    std::vector<int> services;
    std::vector<std::string> texts;
    std::optional<double> timeout; ///< seconds
};
std::vector<std::string> NotificationTypes();
std::string KindOf(const std::string& type); ///< of the subscriptions that receive it
Exit Notify(const NotifyOptions& options, const Command& command);
/// @}

/// @name Push.cpp
/// @{
struct PushOptions
{
    std::string service;
    std::string data;
    std::string message;
    long long time = std::time(nullptr);
};
Exit Push(const PushOptions& options, const Command& command);
/// @}

/// @name Services.cpp
/// @{
struct ServicesOptions
{
    std::string serial; ///< empty for that of the device in use
};
Exit RunServices(const ServicesOptions& options, const Command& command);
/// @}

/// @name Subscribe.cpp
/// @{
struct SubscribeOptions
{
    std::vector<std::string> kinds; ///< of DASubscriberStore::Kinds()
    std::string key;
    std::vector<std::string> pushes;
    std::string name;  ///< empty to use only the connection's unique name
    std::string store; ///< empty to use the subscription service or, without it, the usual file
};
Exit Subscribe(const SubscribeOptions& options, const Command& command);
/// @}

/// @name Subscribers.cpp
/// @{
struct SubscriptionOptions
{
    std::string kind, key, busName, objectPath, interface;
};
Exit ListSubscribers(const Command& command);
Exit AddSubscriber(const SubscriptionOptions& options, const Command& command);
Exit RemoveSubscriber(const SubscriptionOptions& options, const Command& command);
/// @}

#endif
