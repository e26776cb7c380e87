#include "platform/xmlmodule/SimpleXmlText.h"

#include <libxml/parser.h>

#include <algorithm>
#include <set>
#include <string_view>
#include <utility>

namespace panelglow::platform {

namespace {

std::string_view Plain(const xmlChar* text) {
  return text == nullptr ? std::string_view() : reinterpret_cast<const char*>(text);
}

bool IsBlank(std::string_view text) { return text.find_first_not_of(" \t\n\r") == std::string_view::npos; }

bool IsText(const xmlNode& node) { return node.type == XML_TEXT_NODE || node.type == XML_CDATA_SECTION_NODE; }

std::string Qualified(const xmlNs* space, const xmlChar* name) {
  const std::string_view prefix = space == nullptr ? std::string_view() : Plain(space->prefix);
  return (prefix.empty() ? std::string() : std::string(prefix) + ":") + std::string(Plain(name));
}

// Writes one document, remembering the first thing that has no place in the form. It recurses once a level of
// elements, of which documents have few hundred at most.
class Writer {
 public:
  void WriteDocument(const xmlDoc& document) {
    constexpr int kNoDeclaration = -1;
    if (document.standalone != kNoDeclaration) {
      text_ += "<?xml";
      WriteAttribute("version", Plain(document.version));
      if (document.encoding != nullptr) {
        WriteAttribute("encoding", "UTF-8");  // what this text is
      }
      if (document.standalone >= 0) {
        WriteAttribute("standalone", document.standalone == 1 ? "yes" : "no");
      }
      text_ += "?>\n";
    }
    // What stands around the root stands in front of it.
    for (const xmlNode* node = document.children; node != nullptr; node = node->next) {
      WriteInstruction(*node);
    }
    for (const xmlNode* node = document.children; node != nullptr; node = node->next) {
      if (node->type == XML_ELEMENT_NODE) {
        WriteElement(*node);
      }
    }
  }

  std::optional<std::string> Take(XmlProblem& problem) {
    if (problem_.reason.empty()) {
      return std::move(text_);
    }
    problem = std::move(problem_);
    return std::nullopt;
  }

 private:
  void Refuse(const xmlNode& node, const std::string& reason) {
    if (problem_.reason.empty()) {
      problem_ = {XML_ERR_OK, "line " + std::to_string(xmlGetLineNo(&node)) + ": " + reason + "\n", ""};
    }
  }

  void WriteEscaped(std::string_view text) {
    for (const char c : text) {
      switch (c) {
        case '<':
          text_ += "&lt;";
          break;
        case '>':
          text_ += "&gt;";
          break;
        case '&':
          text_ += "&amp;";
          break;
        case '"':
          text_ += "&quot;";
          break;
        case '\t':
          text_ += "&#09;";
          break;
        case '\n':
          text_ += "&#10;";
          break;
        case '\r':
          text_ += "&#13;";
          break;
        default:
          text_ += c;
          break;
      }
    }
  }

  void WriteAttribute(std::string_view name, std::string_view value) {
    text_.append(" ").append(name).append("=\"");
    WriteEscaped(value);
    text_ += '"';
  }

  void WriteAttributes(const xmlNode& element) {
    std::set<std::string> lowered;
    const auto write = [&](const std::string& name, std::string_view value) {
      std::string lower = name;
      std::transform(lower.begin(), lower.end(), lower.begin(),
                     [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; });
      if (!lowered.insert(lower).second) {
        Refuse(element, "two attributes differ in the case of their names only (" + name + ")");
      }
      WriteAttribute(name, value);
    };
    for (const xmlNs* space = element.nsDef; space != nullptr; space = space->next) {
      write(space->prefix == nullptr ? "xmlns" : "xmlns:" + std::string(Plain(space->prefix)), Plain(space->href));
    }
    for (xmlAttr* attribute = element.properties; attribute != nullptr; attribute = attribute->next) {
      xmlChar* value = xmlNodeListGetString(element.doc, attribute->children, 1);
      write(Qualified(attribute->ns, attribute->name), Plain(value));
      xmlFree(value);
    }
  }

  // Comments and instructions; anything else is passed over.
  void WriteInstruction(const xmlNode& node) {
    if (node.type != XML_COMMENT_NODE && node.type != XML_PI_NODE) {
      return;
    }
    const std::string_view content = Plain(node.content);
    if (content.find("?>") != std::string_view::npos) {
      Refuse(node, "a comment holds \"?>\"");
    }
    text_.append("<?").append(node.type == XML_PI_NODE ? Plain(node.name) : kXmlComment);
    text_.append(content.empty() ? "" : " ").append(content).append("?>");
  }

  void WriteElement(const xmlNode& element) {
    const xmlNode* const lastChild = xmlLastElementChild(const_cast<xmlNode*>(&element));
    for (const xmlNode* node = lastChild == nullptr ? element.children : lastChild->next; node != nullptr;
         node = node->next) {
      WriteInstruction(*node);
    }
    const std::string name = Qualified(element.ns, element.name);
    if (name.ends_with("--")) {
      Refuse(element, "the name " + name + " cannot be told from a comment's end");
    }
    text_.append("<").append(name);
    WriteAttributes(element);
    text_ += '>';
    WriteText(element);
    for (const xmlNode* node = lastChild == nullptr ? nullptr : element.children; node != nullptr;
         node = node == lastChild ? nullptr : node->next) {
      if (node->type == XML_ELEMENT_NODE) {
        WriteElement(*node);
      } else {
        WriteInstruction(*node);
      }
    }
    text_.append("</").append(name).append(">");
  }

  // The element's text; blanks alone are none.
  void WriteText(const xmlNode& element) {
    std::string text;
    bool behindChild = false;
    for (const xmlNode* node = element.children; node != nullptr; node = node->next) {
      if (node->type == XML_ELEMENT_NODE) {
        behindChild = true;
      } else if (IsText(*node) && !behindChild) {
        text += Plain(node->content);
      } else if (IsText(*node) && !IsBlank(Plain(node->content))) {
        Refuse(*node, "text stands behind an element");
      }
    }
    if (behindChild) {
      // In front of a child stands what lays the file out, new at each writing.
      text.erase(text.find_last_not_of(" \t\r\n") + 1);
    }
    if (!IsBlank(text)) {
      WriteEscaped(text);
    }
  }

  std::string text_;
  XmlProblem problem_;
};

}  // namespace

std::optional<std::string> SimpleXmlText(const xmlDoc& document, XmlProblem& problem) {
  Writer writer;
  writer.WriteDocument(document);
  return writer.Take(problem);
}

}  // namespace panelglow::platform
