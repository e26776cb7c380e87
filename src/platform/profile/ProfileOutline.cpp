#include "platform/profile/ProfileLines.h"
#include "platform/profile/ProfileText.h"

namespace panelglow::platform::profile {

using lines::EachLine;
using lines::Header;
using lines::Line;
using lines::LineEnd;
using lines::NextHeader;
using lines::NextLine;

void VisitLines(std::string_view text, const std::function<void(const OutlineLine&)>& visit) {
  std::size_t number = 1;
  std::size_t counted = 0;  // lines up to here are in `number`
  const auto numberOf = [&](std::size_t line) {
    while (counted < line) {
      counted = NextLine(text, LineEnd(text, counted));
      ++number;
    }
    return number;
  };
  const auto columnOf = [](std::size_t line, const char* at, std::string_view all) {
    return static_cast<std::size_t>(at - all.data()) - line + 1;
  };
  const auto lines = [&](std::size_t begin, std::size_t end) {
    EachLine(text, begin, end, [&](const Line<char>& line) {
      OutlineLine outline;
      outline.number = numberOf(line.begin);
      outline.column = columnOf(line.begin, line.content.data(), text);
      outline.isEntry = line.IsEntry();
      outline.name = line.IsEntry() ? line.Key() : line.content;
      outline.line = text.substr(line.begin, line.end - line.begin);
      if (line.IsEntry()) {
        outline.value = line.Value();
        outline.valueColumn = outline.value.empty() ? outline.column + line.equals + 1
                                                    : columnOf(line.begin, outline.value.data(), text);
      }
      visit(outline);
      return false;
    });
  };
  std::size_t body = 0;
  for (std::optional<Header<char>> header = NextHeader(text, 0); header; header = NextHeader(text, body)) {
    lines(body, header->line);
    OutlineLine outline;
    outline.number = numberOf(header->line);
    outline.column = text.find('[', header->line) - header->line + 1;
    outline.isHeader = true;
    outline.name = header->name;
    outline.line = text.substr(header->line, LineEnd(text, header->line) - header->line);
    visit(outline);
    body = header->body;
  }
  lines(body, text.size());
}

}  // namespace panelglow::platform::profile
