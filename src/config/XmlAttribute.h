// One attribute of an element: a name and a decoded value.
#pragma once

#include <string>
#include <utility>

#include "config/Persistent.h"

namespace panelglow {

class XmlAttribute : public Persistent {
 public:
  XmlAttribute() = default;
  XmlAttribute(std::string attributeName, std::string attributeValue)
      : name(std::move(attributeName)), value(std::move(attributeValue)) {}

  [[nodiscard]] unsigned int Version() const override { return 0; }
  void ReadAndWrite(ptstream& stream, Direction direction, unsigned int version) override;
  void CopyFrom(const Persistent* other) override;
  [[nodiscard]] std::string GetRealClassName() const override { return "XmlAttribute"; }
  [[nodiscard]] std::unique_ptr<Persistent> CreateCopy() const override {
    return std::make_unique<XmlAttribute>(*this);
  }

  std::string name;
  std::string value;
};

}  // namespace panelglow
