// What this backend has to say to people: standard error, one sentence a line, begun with the program's name.
#pragma once

#include <mutex>
#include <set>
#include <string>
#include <string_view>

namespace panelglow::platform::posix {

void TellPeople(std::string_view sentence);

/// For what happens at every blink: each sentence is said once in the life of the object. Any thread may say it.
class OnceTeller {
 public:
  void Tell(const std::string& sentence);

 private:
  std::mutex guard_;
  std::set<std::string> told_;
};

}  // namespace panelglow::platform::posix
