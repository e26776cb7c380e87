// One attribute of an element: a name and a decoded value.
#pragma once

#include <string>
#include <string_view>

#include "config/Persistent.h"
#include "config/XmlText.h"

namespace panelglow {

class XmlAttribute final : public Persistent {
 public:
  XmlAttribute() = default;
  /// `blocks`: see XmlText.
  XmlAttribute(std::string_view attributeName, std::string_view attributeValue, XmlBlocks* blocks = nullptr)
      : name(attributeName, blocks), value(attributeValue, blocks) {}

  void ReadAndWrite(ptstream& stream, Direction direction, unsigned int version) override;
  void CopyFrom(const Persistent* other) override;
  [[nodiscard]] std::string GetRealClassName() const override { return "XmlAttribute"; }
  [[nodiscard]] std::unique_ptr<Persistent> CreateCopy() const override {
    return std::make_unique<XmlAttribute>(*this);
  }

  XmlText name;
  XmlText value;
};

}  // namespace panelglow
