// The real machine under Linux. What it cannot reach yet answers as absent.
#pragma once

#include "platform/AbsentDevices.h"
#include "platform/Host.h"
#include "platform/host_linux/AbsentInputs.h"
#include "platform/host_linux/LinuxClock.h"
#include "platform/host_linux/LinuxConsole.h"
#include "platform/host_linux/LinuxCpu.h"
#include "platform/host_linux/LinuxDesktop.h"
#include "platform/host_linux/LinuxDeviceTree.h"
#include "platform/host_linux/LinuxDriver.h"
#include "platform/host_linux/LinuxEnvironment.h"
#include "platform/host_linux/LinuxFiles.h"
#include "platform/host_linux/LinuxManagement.h"
#include "platform/host_linux/LinuxModules.h"
#include "platform/host_linux/LinuxMutexes.h"
#include "platform/host_linux/LinuxRegistry.h"
#include "platform/host_linux/LinuxThreads.h"
#include "platform/posix/LazyDrawing.h"
#include "platform/posix/LazyXmlDocuments.h"
#include "platform/profile/ProfileFilesOnFiles.h"

namespace panelglow::platform::host_linux {

/// Making it costs next to nothing: whatever is more than an object in memory is made by the call that needs it.
struct LinuxHost {
  LinuxClock clock;
  LinuxConsole console;
  LinuxCpu cpu;
  LinuxDriver driver;
  LinuxEnvironment environment;
  LinuxFiles files;
  posix::LazyDrawing drawing;
  LinuxDesktop desktop{drawing};
  posix::DrawnImages images{drawing};
  AbsentInputs inputs;
  LinuxDeviceTree deviceTree;
  LinuxManagement management;
  LinuxModules modules;
  LinuxRegistry registry;
  LinuxMutexes mutexes;
  profile::ProfileFilesOnFiles profiles{files};
  LinuxThreads threads;
  posix::LazyXmlDocuments xmlDocuments{files};
  AbsentDevices devices;
  Host host{.cameras = devices,
            .clock = clock,
            .connections = devices,
            .console = console,
            .cpu = cpu,
            .desktop = desktop,
            .deviceTree = deviceTree,
            .drivers = driver,
            .environment = environment,
            .files = files,
            .images = images,
            .keyboard = inputs,
            .management = management,
            .modules = modules,
            .mutexes = mutexes,
            .profiles = profiles,
            .rawDisks = devices,
            .registry = registry,
            .services = driver,
            .threads = threads,
            .touchpad = inputs,
            .xmlDocuments = xmlDocuments};
};

}  // namespace panelglow::platform::host_linux
