// What the program's result codes mean, for people.
#pragma once

#include <string>

namespace panelglow::controller {

/// A clause as "the green power LED was not recognised"; empty for a code that is not one of the program's own, as
/// those which an installation gives its buttons.
std::string WordsFor(const std::string& code);

}  // namespace panelglow::controller
