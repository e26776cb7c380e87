#include "platform/posix/LazyXmlDocuments.h"

#include <cstdio>
#include <string>

#include "platform/posix/ModuleLoader.h"

namespace panelglow::platform::posix {

std::unique_ptr<XmlDocument> LazyXmlDocuments::Create() {
  std::call_once(once_, [this] {
    using Maker = XmlDocuments* (*)(Files&);
    std::string error;
    if (const auto make =
            reinterpret_cast<Maker>(LoadSymbol("panelglow-xml", "PanelglowXmlDocumentsOnFiles", error))) {
      documents_.reset(make(files_));
    } else {
      std::fprintf(stderr, "structured documents are not available: %s\n", error.c_str());
    }
  });
  return documents_ == nullptr ? nullptr : documents_->Create();
}

}  // namespace panelglow::platform::posix
