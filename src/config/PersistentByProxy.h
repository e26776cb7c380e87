// For classes that can be streamed and are no Persistent themselves: a proxy stands for such an object in a stream.
#pragma once

#include <memory>
#include <string>

#include "config/Persistent.h"

namespace panelglow {

class PersistentByProxy;

/// What a stream knows of a PersistentByProxy: its identity.
class StreamProxy final : public Persistent {
 public:
  StreamProxy() = default;
  explicit StreamProxy(PersistentByProxy* proxyOwner) : owner(proxyOwner) {}

  void ReadAndWrite(ptstream& /*stream*/, Direction /*direction*/, unsigned int /*version*/) override {}
  void CopyFrom(const Persistent* /*other*/) override {}  // an identity is not copied
  [[nodiscard]] std::string GetRealClassName() const override { return "StreamProxy"; }
  [[nodiscard]] std::unique_ptr<Persistent> CreateCopy() const override { return std::make_unique<StreamProxy>(); }

  [[nodiscard]] PersistentByProxy* GetOwner() const { return owner; }

 private:
  PersistentByProxy* owner = nullptr;  // not owned
};

/// The operations mean the same as those of Persistent.
class PersistentByProxy {
 public:
  using Direction = Persistent::Direction;

  PersistentByProxy() : proxy(std::make_unique<StreamProxy>(this)) {}
  virtual ~PersistentByProxy() = default;

  // A copy is an object of its own.
  PersistentByProxy(const PersistentByProxy& /*other*/) : PersistentByProxy() {}
  PersistentByProxy& operator=(const PersistentByProxy& /*other*/) { return *this; }

  [[nodiscard]] virtual unsigned int Version() const { return 0; }
  virtual void ReadAndWrite(ptstream& stream, Direction direction, unsigned int version) = 0;
  virtual void CopyFrom(const PersistentByProxy* other) = 0;
  [[nodiscard]] virtual std::unique_ptr<PersistentByProxy> CreateCopy() const = 0;
  [[nodiscard]] virtual std::string GetRealClassName() const = 0;
  virtual void MoveFrom(PersistentByProxy& other) { CopyFrom(&other); }

  [[nodiscard]] StreamProxy& GetProxy() const { return *proxy; }

 private:
  std::unique_ptr<StreamProxy> proxy;
};

}  // namespace panelglow
