// One declared parameter of a subtest.
#pragma once

#include <memory>
#include <string>

#include "harness/CDMConstraint.h"

namespace panelglow {

class CDMArgument {
 public:
  /// `argumentName` with its leading hyphen, as "-Retries". The constraint may be null.
  CDMArgument(const std::string& argumentName, CDMArgumentType argumentType, const std::string& argumentDefault,
              const std::string& argumentDescription, bool isRequired, std::unique_ptr<CDMConstraint> rule,
              bool isHidden, bool isGuiHidden);
  virtual ~CDMArgument() = default;

  [[nodiscard]] const std::string& GetName() const { return name; }
  [[nodiscard]] CDMArgumentType GetType() const { return type; }
  [[nodiscard]] const std::string& GetDefaultValue() const { return defaultValue; }
  [[nodiscard]] const std::string& GetDescription() const { return description; }
  [[nodiscard]] bool IsRequired() const { return required; }
  [[nodiscard]] bool IsHidden() const { return hidden; }
  [[nodiscard]] bool IsGuiHidden() const { return guiHidden; }

  /// True when the value has the type's form and passes the constraint.
  [[nodiscard]] bool Validate(const std::string& value) const;

  /// The block of this argument in the argument help.
  [[nodiscard]] std::string GetHelp() const;

  /// The element of this argument in the catalogue, behind `indent` blanks.
  [[nodiscard]] std::string GetCatalogEntry(int indent) const;

  /// The keys of this argument in the dictionary, under the subtest's name `prefix`.
  [[nodiscard]] std::string GetDictionaryEntry(const std::string& prefix) const;

 private:
  std::string name;
  CDMArgumentType type;
  std::string defaultValue;
  std::string description;
  bool required;
  std::unique_ptr<CDMConstraint> constraint;
  bool hidden;     // left out of the argument help
  bool guiHidden;  // marked in the catalogue
};

}  // namespace panelglow
