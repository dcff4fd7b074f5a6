/// @file
/// Facts from files of the machine. Each call reads its files again.
#ifndef KIV_SOURCES_HOSTFILES_H
#define KIV_SOURCES_HOSTFILES_H

#include "Source.h"

#include <string>

namespace kiv::platform
{

class HostFiles : public Source
{
public:
    /// @param root  the folder that the files are below; empty for those of the machine
    explicit HostFiles(std::string root = {}) : root_(std::move(root)) {}

    /// Reads everything but packages.
    void ReadAll(Device& device);

    /// Reads a text, or the reason why it is missing; does nothing for a text that does not come from a file.
    void Refresh(Device& device, Text Device::*text) override;

    /// Reads the free space of the file system with the users' data.
    void RefreshStorage(Device& device) override;

    /// Reads the version of one package. A package that is not installed is removed from those of the device.
    /// @return whether this machine has dpkg
    bool RefreshPackage(Device& device, const std::string& id) override;

private:
    const std::string root_;
};

} // namespace kiv::platform

#endif
