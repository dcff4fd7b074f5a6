/// @file
/// Facts from files of the machine. Each call reads its files again.
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

    /// Reads every text that comes from a file, or the reason why it is missing.
    void Read(Device& device) const;

    /// Reads one of them; does nothing for a text that does not come from a file.
    void Read(Device& device, Text Device::*text) const;

    /// Reads the free space of the file system with the users' data.
    void ReadStorage(Device& device) const;

    /// Reads the version of one package. A package that is not installed is removed from those of the device.
    /// @return whether this machine has dpkg
    bool ReadPackage(Device& device, const std::string& id) const;

private:
    const std::string root_;
};

} // namespace kiv::platform

#endif
