// Structured XML documents by libxml2. A module of its own: it is loaded when the first document is made, so that a
// run without one does not pay for it.
#include <libxml/SAX2.h>
#include <libxml/parser.h>
#include <libxml/tree.h>
#include <libxml/xmlschemas.h>

#include <algorithm>
#include <limits>
#include <memory>
#include <optional>
#include <string>

#include "platform/Files.h"
#include "platform/XmlDocuments.h"
#include "platform/xmlmodule/SimpleXmlText.h"

namespace panelglow::platform {

namespace {

template <auto Free>
struct Deleter {
  template <class T>
  void operator()(T* object) const {
    Free(object);
  }
};
using Document = std::unique_ptr<xmlDoc, Deleter<xmlFreeDoc>>;
using ParserContext = std::unique_ptr<xmlParserCtxt, Deleter<xmlFreeParserCtxt>>;
using SchemaParser = std::unique_ptr<xmlSchemaParserCtxt, Deleter<xmlSchemaFreeParserCtxt>>;
using Schema = std::unique_ptr<xmlSchema, Deleter<xmlSchemaFree>>;
using Validator = std::unique_ptr<xmlSchemaValidCtxt, Deleter<xmlSchemaFreeValidCtxt>>;

constexpr int kDeepestElement = 256;
constexpr const char* kSchemaInstance = "http://www.w3.org/2001/XMLSchema-instance";

const xmlChar* Xml(const std::string& text) { return reinterpret_cast<const xmlChar*>(text.c_str()); }

std::string Plain(const xmlChar* text) { return text == nullptr ? "" : reinterpret_cast<const char*>(text); }

std::string PathOf(const xmlNode* node) {
  if (node == nullptr) {
    return {};
  }
  xmlChar* path = xmlGetNodePath(const_cast<xmlNode*>(node));
  std::string text = Plain(path);
  xmlFree(path);
  return text;
}

// What callbacks of one operation report.
struct Findings {
  std::vector<XmlProblem> problems;

  void Add(const xmlError* error, const xmlNode* node) {
    XmlProblem problem;
    problem.code = error->code;
    problem.reason = error->message == nullptr ? "unknown problem\n" : error->message;
    if (error->line > 0) {
      problem.reason = "line " + std::to_string(error->line) + ": " + problem.reason;
    }
    if (!problem.reason.ends_with('\n')) {
      problem.reason += '\n';
    }
    problem.location = PathOf(node);
    problems.push_back(std::move(problem));
  }
};

#if LIBXML_VERSION >= 21200
using ErrorRecord = const xmlError*;
#else
using ErrorRecord = xmlError*;
#endif

// A warning, as of a name space that is no absolute address, does not make a document one that is not well formed.
void NoteParseError(void* userData, ErrorRecord error) {
  if (error->level == XML_ERR_WARNING) {
    return;
  }
  auto* context = static_cast<xmlParserCtxt*>(userData);
  static_cast<Findings*>(context->_private)->Add(error, context->node);
}

void NoteSchemaError(void* userData, ErrorRecord error) {
  static_cast<Findings*>(userData)->Add(error, static_cast<const xmlNode*>(error->node));
}

// A document type declaration can declare entities that grow without bound or name files: none is let in.
void RefuseDocumentType(void* userData, const xmlChar* name, const xmlChar*, const xmlChar*) {
  auto* context = static_cast<xmlParserCtxt*>(userData);
  static_cast<Findings*>(context->_private)
      ->problems.push_back({XML_ERR_DOCTYPE_NOT_FINISHED,
                            "a document type declaration (" + Plain(name) + ") is not allowed here\n", ""});
  context->wellFormed = 0;
  xmlStopParser(context);
}

// The parser's own limit of nesting does not hold for documents of any size.
void StartElement(void* userData, const xmlChar* name, const xmlChar* prefix, const xmlChar* address, int spaceCount,
                  const xmlChar** spaces, int attributeCount, int defaultedCount, const xmlChar** attributes) {
  auto* context = static_cast<xmlParserCtxt*>(userData);
  if (context->nodeNr >= kDeepestElement) {
    static_cast<Findings*>(context->_private)
        ->problems.push_back({XML_ERR_INTERNAL_ERROR,
                              "elements are nested deeper than " + std::to_string(kDeepestElement) + " levels\n",
                              ""});
    context->wellFormed = 0;
    xmlStopParser(context);
    return;
  }
  xmlSAX2StartElementNs(userData, name, prefix, address, spaceCount, spaces, attributeCount, defaultedCount,
                        attributes);
}

xmlParserInputPtr RefuseEntity(const char*, const char*, xmlParserCtxtPtr) { return nullptr; }

// Of any size.
Document Parse(const std::string& bytes, Findings& findings) {
  const ParserContext context(xmlNewParserCtxt());
  static_assert(Files::kLargestFile_bytes <= std::numeric_limits<int>::max());
  if (!context) {
    throw XmlComponentError("the XML component has no memory left");
  }
  context->_private = &findings;
  context->sax->internalSubset = RefuseDocumentType;
  context->sax->startElementNs = StartElement;
  context->sax->serror = NoteParseError;
  Document document(xmlCtxtReadMemory(context.get(), bytes.data(), static_cast<int>(bytes.size()), nullptr, nullptr,
                                      XML_PARSE_NONET | XML_PARSE_COMPACT | XML_PARSE_HUGE));
  if (context->wellFormed == 0 || !findings.problems.empty()) {
    document.reset();
  }
  return document;
}

class LibXmlDocument : public XmlDocument {
 public:
  explicit LibXmlDocument(Files& files) : files_(files) {}

  bool Load(std::string_view path, XmlProblem& problem) override {
    Findings findings;
    document_ = LoadFile(path, findings);
    if (!document_) {
      problem = findings.problems.empty() ? XmlProblem{XML_ERR_DOCUMENT_EMPTY, "the file is no XML document\n", ""}
                                          : findings.problems.front();
    }
    return document_ != nullptr;
  }

  void SetRootAttribute(std::string_view name, std::string_view value) override {
    xmlNode* root = document_ ? xmlDocGetRootElement(document_.get()) : nullptr;
    if (root == nullptr) {
      throw XmlComponentError("the document has no root element");
    }
    const std::string text(value);
    if (name.starts_with("xmlns:")) {
      const std::string prefix(name.substr(6));
      if (xmlSearchNs(document_.get(), root, Xml(prefix)) == nullptr) {
        xmlNewNs(root, Xml(text), Xml(prefix));
      }
      return;
    }
    const std::size_t colon = name.find(':');
    if (colon == std::string_view::npos) {
      xmlSetProp(root, Xml(std::string(name)), Xml(text));
      return;
    }
    const std::string prefix(name.substr(0, colon));
    xmlNs* space = xmlSearchNs(document_.get(), root, Xml(prefix));
    if (space == nullptr) {
      throw XmlComponentError("the name space prefix \"" + prefix + "\" is not declared");
    }
    xmlSetNsProp(root, space, Xml(std::string(name.substr(colon + 1))), Xml(text));
  }

  std::string Text() override {
    if (!document_) {
      throw XmlComponentError("no document is loaded");
    }
    xmlChar* bytes = nullptr;
    int size = 0;
    xmlDocDumpMemory(document_.get(), &bytes, &size);
    std::string text = bytes == nullptr ? std::string()
                                        : std::string(reinterpret_cast<char*>(bytes), static_cast<std::size_t>(size));
    xmlFree(bytes);
    return text;
  }

  std::optional<std::string> SimpleText(XmlProblem& problem) override {
    if (!document_) {
      throw XmlComponentError("no document is loaded");
    }
    return SimpleXmlText(*document_, problem);
  }

  std::vector<XmlProblem> LoadAndValidate(std::string_view path) override {
    Findings findings;
    document_ = LoadFile(path, findings);
    if (!document_) {
      if (findings.problems.empty()) {
        findings.problems.push_back({XML_ERR_DOCUMENT_EMPTY, "the file is no XML document\n", ""});
      }
      return findings.problems;
    }
    return Validate();
  }

  std::vector<XmlProblem> Validate() override {
    if (!document_) {
      throw XmlComponentError("no document is loaded");
    }
    Findings findings;
    xmlNode* root = xmlDocGetRootElement(document_.get());
    xmlChar* named = xmlGetNsProp(root, Xml("noNamespaceSchemaLocation"), Xml(kSchemaInstance));
    const std::string schemaPath = Plain(named);
    xmlFree(named);
    const Schema schema = LoadSchema(schemaPath, findings);
    if (!schema) {
      findings.problems.insert(
          findings.problems.begin(),
          {XML_SCHEMAP_FAILED_LOAD, "the schema file \"" + schemaPath + "\" cannot be used\n", "/"});
      return findings.problems;
    }
    const Validator validator(xmlSchemaNewValidCtxt(schema.get()));
    if (!validator) {
      throw XmlComponentError("the XML component has no memory left");
    }
    xmlSchemaSetValidStructuredErrors(validator.get(), NoteSchemaError, &findings);
    const int result = xmlSchemaValidateDoc(validator.get(), document_.get());
    if (result == 0 || !findings.problems.empty()) {
      return IsUndeclared(findings) ? ValidateChildren(validator.get(), root) : findings.problems;
    }
    return {{result, "the document does not fit its schema\n", "/"}};
  }

 private:
  // True when all that was found is that the schema does not know the element that was judged.
  static bool IsUndeclared(const Findings& findings) {
    return findings.problems.size() == 1 && findings.problems.front().code == XML_SCHEMAV_CVC_ELT_1;
  }

  static std::vector<XmlProblem> ValidateChildren(xmlSchemaValidCtxt* validator, const xmlNode* root) {
    std::vector<XmlProblem> problems;
    for (xmlNode* child = root->children; child != nullptr; child = child->next) {
      if (child->type != XML_ELEMENT_NODE) {
        continue;
      }
      Findings findings;
      xmlSchemaSetValidStructuredErrors(validator, NoteSchemaError, &findings);
      xmlSchemaValidateOneElement(validator, child);
      if (!IsUndeclared(findings)) {
        problems.insert(problems.end(), findings.problems.begin(), findings.problems.end());
      }
    }
    return problems;
  }

  Document LoadFile(std::string_view path, Findings& findings) {
    const std::optional<std::string> bytes = files_.Read(path);
    if (!bytes) {
      findings.problems.push_back(
          {XML_IO_LOAD_ERROR, "the file cannot be read, or is longer than 512 MiB\n", "", true});
      return nullptr;
    }
    return Parse(*bytes, findings);
  }

  Schema LoadSchema(const std::string& path, Findings& findings) {
    const std::optional<std::string> bytes = path.empty() ? std::nullopt : files_.Read(path);
    if (!bytes) {
      return nullptr;
    }
    if (!Parse(*bytes, findings)) {
      return nullptr;  // not well formed, or with a document type declaration
    }
    const SchemaParser parser(xmlSchemaNewMemParserCtxt(bytes->data(), static_cast<int>(bytes->size())));
    if (!parser) {
      throw XmlComponentError("the XML component has no memory left");
    }
    xmlSchemaSetParserStructuredErrors(parser.get(), NoteSchemaError, &findings);
    return Schema(xmlSchemaParse(parser.get()));
  }

  Files& files_;
  Document document_;
};

class LibXmlDocuments : public XmlDocuments {
 public:
  explicit LibXmlDocuments(Files& files) : files_(files) {
    xmlInitParser();
    xmlSetExternalEntityLoader(RefuseEntity);
  }
  std::unique_ptr<XmlDocument> Create() override { return std::make_unique<LibXmlDocument>(files_); }

 private:
  Files& files_;
};

}  // namespace

}  // namespace panelglow::platform

/// The caller owns what is returned; `files` has to outlive it.
extern "C" panelglow::platform::XmlDocuments* PanelglowXmlDocumentsOnFiles(panelglow::platform::Files& files) {
  return new panelglow::platform::LibXmlDocuments(files);
}
