#include "boardtool/XmlTags.h"

#include <algorithm>
#include <charconv>

namespace panelglow::boardtool {

namespace {

constexpr std::string_view kEndOfName = " \t\r\n/>";

// Where what begins at `at` and is no tag ends: a comment, a CDATA section, an instruction, a declaration.
std::size_t EndOfOther(std::string_view text, std::size_t at) {
  struct Form {
    std::string_view begin;
    std::string_view end;
  };
  constexpr Form kForms[] = {{"<!--", "-->"}, {"<![CDATA[", "]]>"}, {"<?", "?>"}, {"<!", ">"}};
  for (const Form& form : kForms) {
    if (text.substr(at).starts_with(form.begin)) {
      const std::size_t end = text.find(form.end, at + form.begin.size());
      return end == std::string_view::npos ? text.size() : end + form.end.size();
    }
  }
  return at;
}

// Behind the ">" of a tag; one within quotes does not count.
std::size_t EndOfTag(std::string_view text, std::size_t at) {
  char quote = 0;
  for (; at < text.size(); ++at) {
    const char c = text[at];
    if (quote != 0) {
      quote = c == quote ? '\0' : quote;
    } else if (c == '"' || c == '\'') {
      quote = c;
    } else if (c == '>') {
      return at + 1;
    }
  }
  return text.size();
}

}  // namespace

std::vector<XmlTag> XmlTagsOf(std::string_view text) {
  std::vector<XmlTag> tags;
  std::size_t line = 1;
  std::size_t lineBegin = 0;
  std::size_t counted = 0;
  std::size_t depth = 0;
  for (std::size_t at = text.find('<'); at < text.size(); at = text.find('<', at)) {
    for (; counted < at; ++counted) {
      if (text[counted] == '\n') {
        ++line;
        lineBegin = counted + 1;
      }
    }
    if (const std::size_t other = EndOfOther(text, at); other != at) {
      at = other;
      continue;
    }
    const std::size_t end = EndOfTag(text, at);
    if (text.substr(at).starts_with("</")) {
      depth -= depth > 0 ? 1 : 0;
    } else {
      const std::string_view name = text.substr(at + 1, text.find_first_of(kEndOfName, at + 1) - at - 1);
      tags.push_back({std::string(name), line, at - lineBegin + 1, depth});
      const bool isClosed = end >= 2 && text[end - 2] == '/';
      depth += isClosed ? 0 : 1;
    }
    at = end;
  }
  return tags;
}

const XmlTag* TagAt(const std::vector<XmlTag>& tags, std::string_view path) {
  if (tags.empty()) {
    return nullptr;
  }
  std::size_t begin = 0;
  std::size_t end = tags.size();
  std::size_t found = 0;
  std::size_t depth = 0;
  while (!path.empty() && path.front() == '/') {
    path.remove_prefix(1);
    const std::string_view step = path.substr(0, path.find('/'));
    path.remove_prefix(step.size());
    const std::string_view name = step.substr(0, step.find('['));
    std::size_t wanted = 1;
    if (const std::size_t bracket = step.find('['); bracket != std::string_view::npos) {
      std::from_chars(step.data() + bracket + 1, step.data() + step.size(), wanted);
    }
    std::size_t i = begin;
    for (; i < end; ++i) {
      if (tags[i].depth == depth && (name == "*" || tags[i].name == name) && --wanted == 0) {
        break;
      }
    }
    if (i == end) {
      break;
    }
    found = i;
    begin = i + 1;
    end = static_cast<std::size_t>(std::find_if(tags.begin() + static_cast<std::ptrdiff_t>(begin),
                                                tags.begin() + static_cast<std::ptrdiff_t>(end),
                                                [&](const XmlTag& tag) { return tag.depth <= depth; }) -
                                   tags.begin());
    ++depth;
  }
  return &tags[found];
}

}  // namespace panelglow::boardtool
