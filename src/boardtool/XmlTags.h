// Where the elements of an XML text begin, in document order: an XML tree of ours keeps no places.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace panelglow::boardtool {

struct XmlTag {
  std::string name;
  std::size_t line = 1;
  std::size_t column = 1;
  std::size_t depth = 0;  // 0: the root
};

/// The start tags of a text that is well-formed; of any other as far as it can be told.
std::vector<XmlTag> XmlTagsOf(std::string_view text);

/// The tag at a path as "/UI/Section[2]/Button[1]"; the root for a path that leads nowhere, null without tags.
const XmlTag* TagAt(const std::vector<XmlTag>& tags, std::string_view path);

}  // namespace panelglow::boardtool
