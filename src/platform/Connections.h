// The network connections of the machine, each of one adapter.
#pragma once

#include <memory>
#include <optional>
#include <string>

namespace panelglow::platform {

/// A connection in hand; released with the object.
class Connection {
 public:
  virtual ~Connection() = default;

  /// The adapter's device name; nothing when its properties cannot be had.
  virtual std::optional<std::string> DeviceName() = 0;

  // Both wait until the service has done it, which may take seconds. False when it failed.
  virtual bool Connect() = 0;
  virtual bool Disconnect() = 0;
};

/// A walk over the connections.
class ConnectionList {
 public:
  virtual ~ConnectionList() = default;

  /// The next connection; null at the end, and when the service fails.
  virtual std::unique_ptr<Connection> Next() = 0;
};

class Connections {
 public:
  virtual ~Connections() = default;

  /// Opens the connection manager on the calling thread and begins a walk. Null when there is no such service.
  virtual std::unique_ptr<ConnectionList> Enumerate() = 0;
};

}  // namespace panelglow::platform
