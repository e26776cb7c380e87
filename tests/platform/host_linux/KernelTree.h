// A made-up machine in a folder, laid out as the kernel lays out sysfs, procfs and the device files.
#pragma once

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <string>

#include "platform/host_linux/KernelFiles.h"

namespace panelglow::platform::host_linux {

class KernelTree {
 public:
  KernelTree() {
    std::string name = std::filesystem::temp_directory_path() / "kernel-tree-XXXXXX";
    root_ = std::filesystem::canonical(::mkdtemp(name.data()));
  }
  ~KernelTree() { std::filesystem::remove_all(root_); }
  KernelTree(const KernelTree&) = delete;
  KernelTree& operator=(const KernelTree&) = delete;

  [[nodiscard]] KernelFolders Folders() const {
    return {.sys = root_ / "sys", .dev = root_ / "dev", .proc = root_ / "proc"};
  }
  [[nodiscard]] std::filesystem::path At(const std::string& path) const { return root_ / path; }

  void Put(const std::string& path, const std::string& content) const {
    std::filesystem::create_directories(At(path).parent_path());
    std::ofstream(At(path), std::ios::binary) << content;
  }

  /// Both below the root.
  void Link(const std::string& path, const std::string& target) const {
    std::filesystem::create_directories(At(path).parent_path());
    std::filesystem::create_directories(At(target));
    std::filesystem::create_directory_symlink(At(target), At(path));
  }

  /// `path`: below the host bridge, ends with the function's name. `ids`: vendor, device, subsystem's vendor and
  /// device.
  void AddFunction(const std::string& path, const std::string (&ids)[4], const std::string& classCode,
                   const std::string& driver) const {
    const std::string folder = kBridge + path;
    constexpr const char* kNames[] = {"/vendor", "/device", "/subsystem_vendor", "/subsystem_device"};
    for (std::size_t i = 0; i < 4; ++i) {
      Put(folder + kNames[i], ids[i] + "\n");
    }
    Put(folder + "/class", classCode + "\n");
    Put(folder + "/revision", "0x02\n");
    Link("sys/bus/pci/devices/" + path.substr(path.rfind('/') + 1), folder);
    if (!driver.empty()) {
      Link(folder + "/driver", "sys/bus/pci/drivers/" + driver);
    }
  }

  void AddHost(const std::string& path, const std::string& driver) const {
    const std::string name = path.substr(path.rfind('/') + 1);
    Put(kBridge + path + "/scsi_host/" + name + "/proc_name", driver + "\n");
    Link("sys/class/scsi_host/" + name, kBridge + path + "/scsi_host/" + name);
  }

  /// `device`: below the host bridge; `path`: from there to the disk, which ends with its name.
  void AddDisk(const std::string& device, const std::string& path, const std::string& vendor,
               const std::string& model) const {
    const std::string name = path.substr(path.rfind('/') + 1);
    if (!vendor.empty()) {
      Put(kBridge + device + "/vendor", vendor + "\n");
    }
    Put(kBridge + device + "/model", model + "  \n");
    Put(kBridge + device + path + "/size", "131072\n");
    Link(kBridge + device + path + "/device", kBridge + device);
    Link("sys/block/" + name, kBridge + device + path);
  }

  static constexpr const char* kBridge = "sys/devices/pci0000:00/";

 private:
  std::filesystem::path root_;
};

}  // namespace panelglow::platform::host_linux
