// Which drives a test makes busy: the controllers of a selection that have a disk, and the disk of a controller.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace panelglow {

/// Device instance ids of the controllers that a selection names and that have a disk, IDE-type controllers first:
/// every one for "all", the first for "any" where `anyIsOne`, otherwise one for each name of the comma list that
/// equals the controller's name in the mass-storage INI file. Throws what the storage library throws.
std::vector<std::string> getCntrlListForHDD(const std::string& selection, const std::string& massStorageIni,
                                            bool anyIsOne);

/// The controller's name in the INI file; empty when there is no file or it names no such controller.
std::string FindControllerDetails(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subDeviceId,
                                  std::uint32_t subVendorId, const std::string& massStorageIni);

/// The device instance id of the first child of a controller that is a disk; empty when it has none.
std::string FindDiskOf(const std::string& controllerId);

/// The path of the first disk whose device path holds a backslash and this word; empty when there is none.
std::string FindDrivePath(std::string_view type);

// The three numbers of a drive's address, as "0,12,3", each by its fixed place; 0 when the text is too short.
std::uint8_t ParseBufferForAdapter(std::string_view address);
std::uint8_t ParseBufferForTarget(std::string_view address);
std::uint8_t ParseBufferForLun(std::string_view address);

}  // namespace panelglow
