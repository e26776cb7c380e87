// The entities that XML texts may hold, read. Writing them is XmlObject's own.
#pragma once

#include <string>
#include <string_view>

namespace panelglow {

class XmlEntityDecoder {
 public:
  /// `text` with the known entities replaced by their characters, from left to right; any other "&" stays. Good until
  /// the next call.
  std::string_view Decode(std::string_view text);

 private:
  std::string decoded_;  // kept: a log has very many short texts, and each would need memory anew
};

}  // namespace panelglow
