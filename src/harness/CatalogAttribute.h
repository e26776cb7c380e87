// The one form of an attribute in the catalogue.
#pragma once

#include <string>
#include <string_view>

namespace panelglow {

/// A blank, the name, and the value in quotation marks, as it stands.
inline std::string CatalogAttribute(std::string_view name, std::string_view value) {
  return " " + std::string(name) + "=\"" + std::string(value) + "\"";
}

/// The same; nothing for an empty value.
inline std::string CatalogAttributeIfAny(std::string_view name, std::string_view value) {
  return value.empty() ? std::string() : CatalogAttribute(name, value);
}

}  // namespace panelglow
