// The real machine under Linux. What Linux has no door to (a touchpad's LED) answers as absent.
#pragma once

#include "platform/AbsentDevices.h"
#include "platform/Host.h"
#include "platform/host_linux/AbsentTouchpad.h"
#include "platform/host_linux/EmptyManagement.h"
#include "platform/host_linux/LinuxCameras.h"
#include "platform/host_linux/LinuxClock.h"
#include "platform/host_linux/LinuxConnections.h"
#include "platform/host_linux/LinuxConsole.h"
#include "platform/host_linux/LinuxCpu.h"
#include "platform/host_linux/LinuxDesktop.h"
#include "platform/host_linux/LinuxDriver.h"
#include "platform/host_linux/LinuxEnvironment.h"
#include "platform/host_linux/LinuxFiles.h"
#include "platform/host_linux/LinuxKeyboard.h"
#include "platform/host_linux/LinuxMutexes.h"
#include "platform/host_linux/LinuxRawDisks.h"
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
  LinuxKeyboard keyboard;
  EmptyManagement management;
  LinuxMutexes mutexes;
  profile::ProfileFilesOnFiles profiles{files};
  LinuxRawDisks rawDisks;
  LinuxThreads threads;
  posix::LazyXmlDocuments xmlDocuments{files};
  AbsentDevices devices;
  Host host{.cameras = cameras,
            .clock = clock,
            .connections = connections,
            .console = console,
            .cpu = cpu,
            .desktop = desktop,
            .deviceTree = devices,
            .drivers = driver,
            .environment = environment,
            .files = files,
            .images = images,
            .keyboard = keyboard,
            .management = management,
            .modules = devices,
            .mutexes = mutexes,
            .profiles = profiles,
            .rawDisks = rawDisks,
            .registry = devices,
            .services = driver,
            .threads = threads,
            .touchpad = touchpad,
            .xmlDocuments = xmlDocuments};
};

}  // namespace panelglow::platform::host_linux
