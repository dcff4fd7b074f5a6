/// @file
/// What files of the machine tell of it, each read anew when it is asked for.
#ifndef KIV_SOURCES_HOSTFILES_H
#define KIV_SOURCES_HOSTFILES_H

#include "DeviceControl.h"

#include <string>

namespace kiv::platform
{

class HostFiles
{
public:
    /// @param root  the folder that the files are below; empty for those of the machine
    explicit HostFiles(std::string root) : root_(std::move(root)) {}

    /// Reads each text that a file holds, or why it is missing.
    void Read(Device& device) const;

    /// Reads one of them; does nothing for a text that no file holds.
    void Read(Device& device, Text Device::*text) const;

    /// Reads the free space of the file system with the users' data.
    void ReadStorage(Device& device) const;

    /// Reads the version of one package, which is missing among those of the device when it is not installed.
    /// @return whether this machine has dpkg
    bool ReadPackage(Device& device, const std::string& id) const;

private:
    const std::string root_;
};

} // namespace kiv::platform

#endif
