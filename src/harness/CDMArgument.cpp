#include "harness/CDMArgument.h"

#include <utility>

#include "harness/CatalogAttribute.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr std::size_t kHelpColumn = 24;  // where the description begins

bool HasForm(CDMArgumentType type, const std::string& value) {
  switch (type) {
    case CDMArgumentType::Integer:
    case CDMArgumentType::LargeInteger:
      return CDMUtil::IsInteger(value);
    case CDMArgumentType::Boolean:
      return CDMUtil::IsBoolean(value);
    case CDMArgumentType::Double:
      return CDMUtil::IsDouble(value);
    default:
      return true;
  }
}

}  // namespace

CDMArgument::CDMArgument(const std::string& argumentName, CDMArgumentType argumentType,
                         const std::string& argumentDefault, const std::string& argumentDescription, bool isRequired,
                         std::unique_ptr<CDMConstraint> rule, bool isHidden, bool isGuiHidden)
    : name(argumentName),
      type(argumentType),
      defaultValue(argumentDefault),
      description(argumentDescription),
      required(isRequired),
      constraint(std::move(rule)),
      hidden(isHidden),
      guiHidden(isGuiHidden) {}

bool CDMArgument::Validate(const std::string& value) const {
  return HasForm(type, value) && (!constraint || constraint->Check(value));
}

std::string CDMArgument::GetHelp() const {
  std::string help = name + "=<" + std::string(WordOf(type)) + ">";
  help.append(help.size() < kHelpColumn ? kHelpColumn - help.size() : 2, ' ');
  help += description;
  if (constraint) {
    help += constraint->GetHelp();
  }
  if (!defaultValue.empty()) {
    help += "\n\t * Default value: " + defaultValue;
  }
  help += "\n\t * Required: " + CDMUtil::ToString(required);
  return help;
}

std::string CDMArgument::GetCatalogEntry(int indent) const {
  std::string entry(static_cast<std::size_t>(indent), ' ');
  entry += "<ARGUMENT" + CatalogAttributeIfAny("Name", name) + CatalogAttribute("Type", WordOf(type)) +
           CatalogAttributeIfAny("Value", defaultValue);
  if (constraint) {
    entry += constraint->GetCatalogAttributes();
  }
  entry += CatalogAttribute("Required", CDMUtil::ToString(required)) +
           CatalogAttributeIfAny("Description", CDMUtil::EscapeXml(CDMUtil::OnOneLine(description)));
  if (hidden) {
    entry += CatalogAttribute("Hidden", "true");
  }
  if (guiHidden) {
    entry += CatalogAttribute("GUIHidden", "true");
  }
  return entry + " />";
}

std::string CDMArgument::GetDictionaryEntry(const std::string& prefix) const {
  const std::string key = prefix + "/" + name;
  std::string entry = "\n" + key + "/Name = TBC\n";
  entry += key + "/Description = " + CDMUtil::OnOneLine(description) + "\n";
  if (constraint) {
    entry += constraint->GetDictionaryEntry(key, type);
  }
  return entry;
}

}  // namespace panelglow
