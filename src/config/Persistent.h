// The base of everything that can be streamed.
#pragma once

#include <memory>
#include <string>

namespace panelglow {

class ptstream;

class Persistent {
 public:
  /// Which way ReadAndWrite moves the fields.
  enum class Direction { kRead, kWrite };

  virtual ~Persistent() = default;

  /// Format version that this class writes.
  [[nodiscard]] virtual unsigned int Version() const = 0;

  /// Moves all fields between this object and the stream; `version` is that of the stored form.
  virtual void ReadAndWrite(ptstream& stream, Direction direction, unsigned int version) = 0;

  /// Takes over the content of `other` when it is another object of the same class; otherwise changes nothing.
  virtual void CopyFrom(const Persistent* other) = 0;

  /// The name under which streams know the class.
  [[nodiscard]] virtual std::string GetRealClassName() const = 0;
  [[nodiscard]] virtual std::unique_ptr<Persistent> CreateCopy() const = 0;

 protected:
  Persistent() = default;
  Persistent(const Persistent&) = default;
  Persistent(Persistent&&) = default;
  Persistent& operator=(const Persistent&) = default;
  Persistent& operator=(Persistent&&) = default;
};

}  // namespace panelglow
