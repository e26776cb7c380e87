// Structured XML documents: strict loading, schema validation, serialisation. Apart from the schema file that the
// document names, nothing is ever fetched, and no entity of a document is ever expanded.
#pragma once

#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace panelglow::platform {

/// One finding of a load or a validation.
struct XmlProblem {
  int code = 0;          // the component's own number
  std::string reason;    // one sentence, ended by a line end
  std::string location;  // path of the element, empty when unknown
  bool unread = false;   // the file's content was not seen, and may be sound
};

/// A failure of the component itself, not of a document.
class XmlComponentError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

inline constexpr std::string_view kXmlComment = "panelglow-comment";

class XmlDocument {
 public:
  virtual ~XmlDocument() = default;

  /// Loads a file. False, with the first problem in `problem`, when it does not open or is not well formed.
  virtual bool Load(std::string_view path, XmlProblem& problem) = 0;

  /// Sets an attribute of the root element of a loaded document. `name` may be a qualified name or a namespace
  /// declaration. Throws XmlComponentError when there is no root.
  virtual void SetRootAttribute(std::string_view name, std::string_view value) = 0;

  /// The document's text. Throws XmlComponentError when nothing is loaded.
  virtual std::string Text() = 0;

  /// The loaded document for a reader that knows elements, attributes, texts and instructions and nothing else:
  /// UTF-8, with a declaration only if there was one, the names as written, the text of an element in one piece in
  /// front of its first child, escaped by the five named entities, "&#09;", "&#10;" and "&#13;". A comment is an
  /// instruction with the target kXmlComment; what stands behind an element's last child stands in front of the
  /// element. Nothing, with the reason in `problem`, when the document holds something that this form has no place
  /// for. Throws XmlComponentError when nothing is loaded.
  virtual std::optional<std::string> SimpleText(XmlProblem& problem) = 0;

  /// Loads a file and validates it as Validate does. A file that does not load is the only problem then.
  virtual std::vector<XmlProblem> LoadAndValidate(std::string_view path) = 0;

  /// Validates the loaded document against the schema that its root names by xsi:noNamespaceSchemaLocation. A root
  /// that the schema does not declare is assessed laxly: its children are judged where the schema declares them.
  /// Returns all problems in document order; none means valid. Throws XmlComponentError when nothing is loaded.
  virtual std::vector<XmlProblem> Validate() = 0;
};

class XmlDocuments {
 public:
  virtual ~XmlDocuments() = default;

  /// A new empty document, or null when the component is not available.
  virtual std::unique_ptr<XmlDocument> Create() = 0;
};

}  // namespace panelglow::platform
