// What this backend has to say to people: standard error, one sentence a line, begun with the program's name.
#pragma once

#include <string_view>

namespace panelglow::platform::posix {

void TellPeople(std::string_view sentence);

}  // namespace panelglow::platform::posix
