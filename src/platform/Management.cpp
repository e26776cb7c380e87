#include "platform/Management.h"

#include <utility>

namespace panelglow::platform {

namespace {

wstring Lowered(std::u16string_view name) {
  wstring lowered(name);
  for (char16_t& c : lowered) {
    c = c >= u'A' && c <= u'Z' ? static_cast<char16_t>(c + 32) : c;
  }
  return lowered;
}

}  // namespace

void ManagementRow::Set(std::u16string_view property, ManagementValue value) {
  properties_[Lowered(property)] = std::move(value);
}

const ManagementValue* ManagementRow::Find(std::u16string_view property) const {
  const auto found = properties_.find(Lowered(property));
  return found == properties_.end() ? nullptr : &found->second;
}

}  // namespace panelglow::platform
