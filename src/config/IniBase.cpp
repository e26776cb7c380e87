#include "config/IniBase.h"

#include <utility>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

std::string& CommentMarker() {
  static std::string marker = ";";
  return marker;
}

}  // namespace

IniBase::IniBase(const std::string& filePath) : path(filePath) {
  if (const std::optional<std::string> content = platform::TheHost().files.Read(filePath)) {
    Parse(*content);
  }
}

void IniBase::Parse(std::string_view text) {
  while (!text.empty()) {
    const std::size_t end = text.find('\n');
    ParseLine(text.substr(0, end));
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
  }
}

void IniBase::ParseLine(std::string_view raw) {
  const std::string& marker = CommentMarker();
  if (!marker.empty()) {
    raw = raw.substr(0, raw.find(marker));
  }
  const std::string line = CDMUtil::Trim(raw);
  if (line.size() > 2 && line.front() == '[') {
    const std::size_t close = line.find(']');
    if (close != std::string::npos && close >= 2) {
      auto section = std::make_unique<Section>(CDMUtil::Trim(std::string_view(line).substr(1, close - 1)));
      current = section.get();
      AddSection(std::move(section));
    }
    return;
  }
  const std::size_t equals = line.find('=');
  if (equals != std::string::npos && equals != 0 && current != nullptr) {
    const std::string_view view = line;
    current->AddRecord(
        std::make_unique<Record>(CDMUtil::Trim(view.substr(0, equals)), CDMUtil::Trim(view.substr(equals + 1))));
  }
}

const Section* IniBase::GetSection(const std::string& name) const {
  const auto found = sections.find(name);
  return found == sections.end() ? nullptr : found->second.get();
}

Section* IniBase::GetSection(const std::string& name) {
  return const_cast<Section*>(std::as_const(*this).GetSection(name));
}

void IniBase::AddSection(std::unique_ptr<Section> section) {
  const std::string name = section->GetName();
  std::unique_ptr<Section>& place = sections[name];
  if (place != nullptr && place.get() == current) {
    current = section.get();
  }
  place = std::move(section);
}

std::string IniBase::ToText() const {
  std::string text;
  for (const auto& [name, section] : sections) {
    text += section->ToText();
  }
  return text;
}

bool IniBase::Save(const std::string& filePath) const { return platform::TheHost().files.Write(filePath, ToText()); }

void IniBase::SetComment(const std::string& marker) { CommentMarker() = marker; }

}  // namespace panelglow
