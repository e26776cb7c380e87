// Texts for the XML parser from a seed: well-formed ones, ones with a fault or an odd byte, deep and large ones. The
// same seed gives the same texts with every compiler, so no call here may depend on the order of evaluation.
#pragma once

#include <cstddef>
#include <cstdint>
#include <random>
#include <string>
#include <string_view>

namespace panelglow {

class RandomXml {
 public:
  explicit RandomXml(std::uint32_t seed) : random_(seed) {}

  /// Any text of any kind.
  std::string Text();

  /// Changes a few places of `text`: bytes are lost, doubled, turned or replaced by something that means something.
  void Damage(std::string& text, std::size_t mostPlaces);

  /// 0 to `limit` - 1.
  std::size_t Below(std::size_t limit) { return random_() % limit; }

 private:
  std::string Element(int levels);
  std::string Attribute();
  std::string Content();
  std::string Soup(std::size_t mostPieces);
  std::string Large();
  std::string Deep();

  std::mt19937 random_;
};

}  // namespace panelglow
