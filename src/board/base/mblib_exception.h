// The board library's exception: one text, composed where the facts are. Thrown by value.
#pragma once

#include <stdexcept>
#include <string>

namespace panelglow {

class mblib_exception : public std::exception {
 public:
  explicit mblib_exception(std::string text) : text_(std::move(text)) {}
  [[nodiscard]] const char* what() const noexcept override { return text_.c_str(); }

 private:
  std::string text_;
};

}  // namespace panelglow
