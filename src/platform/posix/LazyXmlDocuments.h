// Structured documents by the XML module, which is loaded when the first document is made.
#pragma once

#include <mutex>

#include "platform/XmlDocuments.h"

namespace panelglow::platform::posix {

class LazyXmlDocuments : public XmlDocuments {
 public:
  std::unique_ptr<XmlDocument> Create() override;

 private:
  std::once_flag once_;
  XmlDocuments* documents_ = nullptr;
};

}  // namespace panelglow::platform::posix
