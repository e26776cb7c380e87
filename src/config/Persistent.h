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

  /// Format version that this class writes. Whether it can read a stored form of another one is its own to say.
  [[nodiscard]] virtual unsigned int Version() const { return 0; }

  /// Moves all fields between this object and the stream, an optstream or an iptstream by the direction; `version` is
  /// that of the stored form, 0 when writing.
  virtual void ReadAndWrite(ptstream& stream, Direction direction, unsigned int version) = 0;

  /// Takes over the content of `other` when it is another object of the same class; otherwise changes nothing.
  virtual void CopyFrom(const Persistent* other) = 0;

  /// The name under which streams know the class.
  [[nodiscard]] virtual std::string GetRealClassName() const = 0;
  [[nodiscard]] virtual std::unique_ptr<Persistent> CreateCopy() const = 0;

  /// As CopyFrom, of an object that goes away behind it. A class with parts that it streams as values has to take the
  /// parts themselves: others may point at them.
  virtual void MoveFrom(Persistent& other) { CopyFrom(&other); }

 protected:
  Persistent() = default;
  Persistent(const Persistent&) = default;
  Persistent(Persistent&&) = default;
  Persistent& operator=(const Persistent&) = default;
  Persistent& operator=(Persistent&&) = default;
};

}  // namespace panelglow
