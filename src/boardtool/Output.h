// What the tool itself says on standard output, apart from the lines that the library writes for a controller.
#pragma once

#include <string_view>

#include "platform/Console.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

/// Writes to standard output.
void Print(std::string_view text);

/// Writes a sentence to standard error, behind the program's name.
void Say(std::string_view sentence);

/// While it exists, what the library writes to standard output goes to standard error: the output is the tool's own.
class OwnOutput {
 public:
  explicit OwnOutput(platform::Host& machine);
  ~OwnOutput();
  OwnOutput(const OwnOutput&) = delete;
  OwnOutput& operator=(const OwnOutput&) = delete;

  [[nodiscard]] platform::Console& LibraryConsole() { return library_; }

 private:
  class Redirected : public platform::Console {
   public:
    explicit Redirected(platform::Console& console) : console_(console) {}
    void Write(std::string_view bytes) override { console_.WriteError(bytes); }
    void WriteError(std::string_view bytes) override { console_.WriteError(bytes); }
    void SetControlHandler(std::function<bool(std::uint32_t type)> handler) override {
      console_.SetControlHandler(std::move(handler));
    }

   private:
    platform::Console& console_;
  };

  Redirected library_;
};

}  // namespace panelglow::boardtool
