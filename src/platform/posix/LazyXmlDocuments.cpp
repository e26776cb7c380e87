#include "platform/posix/LazyXmlDocuments.h"

#include <string>

#include "platform/posix/ModuleLoader.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::posix {

std::unique_ptr<XmlDocument> LazyXmlDocuments::Create() {
  std::call_once(once_, [this] {
    using Maker = XmlDocuments* (*)(Files&);
    std::string error;
    if (const auto make =
            reinterpret_cast<Maker>(LoadSymbol("panelglow-xml", "PanelglowXmlDocumentsOnFiles", error))) {
      documents_.reset(make(files_));
    } else {
      TellPeople("Structured documents can neither be read nor written, as libpanelglow-xml.so cannot be loaded: " +
                 error + ". Put it beside the program, or into ../lib.");
    }
  });
  return documents_ == nullptr ? nullptr : documents_->Create();
}

}  // namespace panelglow::platform::posix
