#include "config/XmlEntities.h"

#include <algorithm>
#include <array>

namespace panelglow {

namespace {

struct Entity {
  std::string_view text;
  char character;
};
constexpr std::array<Entity, 8> kEntities{{{"&lt;", '<'},
                                           {"&gt;", '>'},
                                           {"&amp;", '&'},
                                           {"&quot;", '"'},
                                           {"&apos;", '\''},
                                           {"&#09;", '\t'},
                                           {"&#10;", '\n'},
                                           {"&#13;", '\r'}}};

// The entity at the start of `text`; for any other "&" one that stands for itself.
Entity EntityAt(std::string_view text) {
  for (const Entity& entity : kEntities) {
    if (text.size() > 1 && text[1] == entity.text[1] && text.starts_with(entity.text)) {
      return entity;
    }
  }
  return {text.substr(0, 1), '&'};
}

}  // namespace

std::string_view XmlEntityDecoder::Decode(std::string_view text) {
  if (decoded_.size() < text.size()) {
    decoded_.resize(text.size());  // nothing gets longer
  }
  char* out = decoded_.data();
  const char* here = text.data();
  const char* const end = here + text.size();
  for (;;) {
    while (here != end && *here != '&') {
      *out++ = *here++;
    }
    if (here == end) {
      return {decoded_.data(), out};
    }
    const Entity entity = EntityAt({here, end});
    *out++ = entity.character;
    here += entity.text.size();
  }
}

}  // namespace panelglow
