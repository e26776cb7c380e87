// The real machine under Linux. What Linux has no door to (a touchpad's LED) answers as absent.
#pragma once

#include "platform/Host.h"
#include "platform/host_linux/AbsentTouchpad.h"
#include "platform/host_linux/LinuxCameras.h"
#include "platform/host_linux/LinuxClock.h"
#include "platform/host_linux/LinuxConnections.h"
#include "platform/host_linux/LinuxConsole.h"
#include "platform/host_linux/LinuxCpu.h"
#include "platform/host_linux/LinuxDesktop.h"
#include "platform/host_linux/LinuxDeviceTree.h"
#include "platform/host_linux/LinuxDriver.h"
#include "platform/host_linux/LinuxEnvironment.h"
#include "platform/host_linux/LinuxFiles.h"
#include "platform/host_linux/LinuxKeyboard.h"
#include "platform/host_linux/LinuxManagement.h"
#include "platform/host_linux/LinuxModules.h"
#include "platform/host_linux/LinuxMutexes.h"
#include "platform/host_linux/LinuxRawDisks.h"
#include "platform/host_linux/LinuxRegistry.h"
#include "platform/host_linux/LinuxThreads.h"
#include "platform/posix/LazyDrawing.h"
#include "platform/posix/LazyXmlDocuments.h"
#include "platform/profile/ProfileFilesOnFiles.h"

namespace panelglow::platform::host_linux {

/// Making it costs next to nothing: whatever is more than an object in memory is made by the call that needs it.
struct LinuxHost {
  LinuxCameras cameras;
  LinuxClock clock;
  LinuxConnections connections;
  LinuxConsole console;
  LinuxCpu cpu;
  LinuxDriver driver;
  LinuxEnvironment environment;
  LinuxFiles files;
  posix::LazyDrawing drawing;
  LinuxDesktop desktop{drawing};
  posix::DrawnImages images{drawing};
  AbsentTouchpad touchpad;
  LinuxDeviceTree deviceTree;
  LinuxKeyboard keyboard;
  LinuxManagement management;
  LinuxModules modules;
  LinuxRegistry registry;
  LinuxMutexes mutexes;
  profile::ProfileFilesOnFiles profiles{files};
  LinuxRawDisks rawDisks;
  LinuxThreads threads;
  posix::LazyXmlDocuments xmlDocuments{files};
  Host host{.cameras = cameras,
            .clock = clock,
            .connections = connections,
            .console = console,
            .cpu = cpu,
            .desktop = desktop,
            .deviceTree = deviceTree,
            .drivers = driver,
            .environment = environment,
            .files = files,
            .images = images,
            .keyboard = keyboard,
            .management = management,
            .modules = modules,
            .mutexes = mutexes,
            .profiles = profiles,
            .rawDisks = rawDisks,
            .registry = registry,
            .services = driver,
            .threads = threads,
            .touchpad = touchpad,
            .xmlDocuments = xmlDocuments};
};

}  // namespace panelglow::platform::host_linux
