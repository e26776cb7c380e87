// Structured documents by the XML module, which is loaded when the first document is made.
#pragma once

#include <memory>
#include <mutex>

#include "platform/Files.h"
#include "platform/XmlDocuments.h"

namespace panelglow::platform::posix {

class LazyXmlDocuments : public XmlDocuments {
 public:
  /// `files` are where documents and schemas are read from.
  explicit LazyXmlDocuments(Files& files) : files_(files) {}

  std::unique_ptr<XmlDocument> Create() override;

 private:
  std::once_flag once_;
  Files& files_;
  std::unique_ptr<XmlDocuments> documents_;
};

}  // namespace panelglow::platform::posix
