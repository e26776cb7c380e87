// Leaves hardware as it was found, however a scope is left.
#pragma once

#include <functional>
#include <string>

namespace panelglow {

class CDMException;

/// What a failure says, for a log line.
std::string TextOf(const CDMException& failure);

/// Calls the action, and logs what it throws instead of passing it on; only the end of the thread passes.
void ActAndLog(const std::function<void()>& action);

/// Puts something back when the scope is left. It is made before the first change, so that also a change that was
/// interrupted is put back; the action has to do nothing as long as there is nothing to put back. A worker that is
/// told to end in the middle of putting back does it once more, undisturbed: after that nothing interrupts the
/// thread any more. What the action throws is logged, and the rest of the run goes on.
class PutBack {
 public:
  explicit PutBack(std::function<void()> action);
  ~PutBack();
  PutBack(const PutBack&) = delete;
  PutBack& operator=(const PutBack&) = delete;

 private:
  std::function<void()> action_;
};

}  // namespace panelglow
