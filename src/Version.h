// The program's version; the build system reads the package's from here.
#pragma once

namespace panelglow {

inline constexpr const char* kVersion =
    "4.10.0, timestamp: Sep 25 2013 13:10:03 1212\n"
    "   (cdm: 4.15.0)\n"
    "   (mb : 4.15.0)\n"
    "   (ms : 4.15.0)";

}  // namespace panelglow
