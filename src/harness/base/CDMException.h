// How a failure that ends a subtest travels: one result code for the controller and any number of log messages, built
// where the facts are known and reported by the manager at the top.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "harness/base/CDMMessage.h"

namespace panelglow {

class CDMException {
 public:
  /// `code` is a result code, printed in at least six digits.
  explicit CDMException(int resultCode) : code(resultCode) {}
  virtual ~CDMException() = default;
  CDMException(const CDMException&) = default;
  CDMException& operator=(const CDMException&) = default;

  void addMessage(LogOptions option, int id, const std::string& text);

  /// In the order of addMessage. A copy of the exception shares its messages.
  [[nodiscard]] std::vector<std::shared_ptr<const CDMMessage>> GetMessages() const { return messages_; }

  /// Logs each message but those with id -1, then reports the code.
  void Report() const;

  int code;

 private:
  std::vector<std::shared_ptr<const CDMMessage>> messages_;
};

/// A call into the firmware's management interface failed.
class InvalidTmbWMIException : public CDMException {
 public:
  explicit InvalidTmbWMIException(const std::string& call);
};

/// A numbered call into the firmware's management interface failed.
class InvalidTmbWMICallException : public CDMException {
 public:
  InvalidTmbWMICallException(std::uint32_t a, std::uint32_t b);
};

}  // namespace panelglow
