#include "controller/ResultWords.h"

#include <algorithm>
#include <iterator>
#include <string_view>

namespace panelglow::controller {

namespace {

struct Row {
  std::string_view code;
  std::string_view words;
};

constexpr Row kRows[] = {
    {"020472", "there is no driver that reaches this machine's LEDs"},
    {"770100", "the Scroll Lock LED was not recognised"},
    {"770101", "the Caps Lock LED was not recognised"},
    {"770102", "the Num Lock LED was not recognised"},
    {"770106", "the drive LED was not recognised"},
    {"770111", "the floppy drive's LED was not recognised"},
    {"770118", "a LED was not answered in time"},
    {"770132", "the red drive LED was not recognised"},
    {"770133", "the green power LED was not recognised"},
    {"770134", "the red power LED was not recognised"},
    {"770146", "the network, touchpad, speaker or microphone LED, or that none blinked, was not recognised"},
    {"770147", "the webcam LED was not recognised"},
    {"770148", "the green or white charge LED was not recognised"},
    {"770149", "the red charge LED was not recognised"},
    {"990100", "a file of the installation is missing"},
    {"990163", "a button file does not fit its schema"},
    {"990354", "the operator cancelled"},
    {"990404", "the XML component failed"},
    {"990431", "this machine's board is not known"},
    {"990471", "nothing was selected to be tested"},
    {"990518", "the test ended for an unknown reason"},
    {"990520", "the parameters were refused"},
    {"990521", "there is no such subtest"},
    {"990618", "an icon file is missing"},
    {"990632", "a button file cannot be read"},
    {"990638", "the XML component is missing"},
    {"990640", "the test dialog could not be shown, or its display went away"},
    {"990826", "a schema file is missing"},
    {"995000", "the run was stopped from outside"},
    {"995205", "the test ended by an error"},
};

}  // namespace

std::string WordsFor(const std::string& code) {
  const auto* const row =
      std::find_if(std::begin(kRows), std::end(kRows), [&](const Row& r) { return r.code == code; });
  return row == std::end(kRows) ? std::string() : std::string(row->words);
}

}  // namespace panelglow::controller
