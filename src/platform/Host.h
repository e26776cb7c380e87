// The machine that the program runs on: one of each platform service.
#pragma once

#include "platform/Cameras.h"
#include "platform/Clock.h"
#include "platform/Connections.h"
#include "platform/Console.h"
#include "platform/Cpu.h"
#include "platform/Desktop.h"
#include "platform/DeviceTree.h"
#include "platform/DriverDevice.h"
#include "platform/Environment.h"
#include "platform/Files.h"
#include "platform/Images.h"
#include "platform/Keyboard.h"
#include "platform/Management.h"
#include "platform/Modules.h"
#include "platform/NamedMutexes.h"
#include "platform/ProfileFiles.h"
#include "platform/RawDisks.h"
#include "platform/Registry.h"
#include "platform/ServiceManager.h"
#include "platform/Threads.h"
#include "platform/Touchpad.h"
#include "platform/XmlDocuments.h"

namespace panelglow::platform {

struct Host {
  Cameras& cameras;
  Clock& clock;
  Connections& connections;
  Console& console;
  Cpu& cpu;
  Desktop& desktop;
  DeviceTree& deviceTree;
  DriverDevices& drivers;
  Environment& environment;
  Files& files;
  Images& images;
  Keyboard& keyboard;
  Management& management;
  Modules& modules;
  NamedMutexes& mutexes;
  ProfileFiles& profiles;
  RawDisks& rawDisks;
  Registry& registry;
  ServiceManager& services;
  Threads& threads;
  Touchpad& touchpad;
  XmlDocuments& xmlDocuments;
};

/// The host that this executable was linked with. Made at first use, so that objects built before `main` may use it,
/// and kept to the end of the process.
Host& TheHost();

}  // namespace panelglow::platform
