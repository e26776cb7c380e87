// Libraries of the system that may or may not be installed.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string_view>
#include <vector>

namespace panelglow::platform {

/// The libraries of graphics makers that know the temperatures of their cards.
enum class GraphicsInterface { kAdl, kNvApi };

struct GraphicsCard {
  std::uint16_t vendorId = 0;
  std::uint16_t deviceId = 0;
};

/// Such a library, loaded and ready until the object goes.
class GraphicsLibrary {
 public:
  virtual ~GraphicsLibrary() = default;

  /// The cards that it serves, each once, in its own order.
  virtual std::vector<GraphicsCard> Cards() = 0;

  /// Degrees Celsius at a card's sensor; both count from 0. Nothing when there is no such sensor or it is not ready.
  virtual std::optional<int> ReadTemperature(std::size_t card, unsigned sensor) = 0;
};

class Modules {
 public:
  virtual ~Modules() = default;

  /// True when the library can be loaded; it is released at once.
  virtual bool CanLoad(std::string_view file) = 0;

  /// Null when the library cannot be loaded or does not have this interface.
  virtual std::unique_ptr<GraphicsLibrary> LoadGraphics(std::string_view file, GraphicsInterface interface) = 0;
};

}  // namespace panelglow::platform
