// The system's own small XML tree with its query language of paths and filters. It knows elements, attributes, text,
// comments, processing instructions and a fixed list of entities; text is bytes. It is no general XML processor: an
// end tag is not compared with its start tag, and only the first text of an element is kept.
#pragma once

#include <iosfwd>
#include <list>
#include <memory>
#include <sstream>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "config/Persistent.h"
#include "config/XmlAttribute.h"
#include "config/XmlList.h"
#include "config/XmlText.h"

namespace panelglow {

class iptstream;
class optstream;

class XmlObject final : public Persistent {
 public:
  /// Elements nested deeper than this are refused with a parse error.
  static constexpr int kDeepestElement = 1000;

  XmlObject() noexcept {}  // a defaulted one would clear the memory first: the parser makes very many

  /// Parses `text`; throws std::runtime_error with line and position when it is malformed.
  explicit XmlObject(const std::string& text);

  // A copy is deep; its parent is null and its depth 0 until it is added somewhere. An element that is assigned to
  // keeps its place in its tree.
  XmlObject(const XmlObject& other);
  XmlObject& operator=(const XmlObject& other);
  XmlObject(XmlObject&& other) noexcept
      : Persistent(std::move(other)),
        name(std::move(other.name)),
        value(std::move(other.value)),
        depth(other.depth),
        attributes(std::move(other.attributes)),
        children(std::move(other.children)),
        prolog(std::move(other.prolog)) {
    LinkChildren();
  }
  XmlObject& operator=(XmlObject&& other) noexcept;
  ~XmlObject() override = default;

  // ---- Persistent

  /// An element that is read keeps its place in its tree, whatever the stream says of its parent and depth; what is
  /// read into its lists stands behind what they hold. An element's parent is written only when the parent is in the
  /// stream already: a part of a tree does not take the tree along.
  void ReadAndWrite(ptstream& stream, Direction direction, unsigned int version) override;
  void CopyFrom(const Persistent* other) override;
  void MoveFrom(Persistent& other) override;
  [[nodiscard]] std::string GetRealClassName() const override { return "XmlObject"; }
  [[nodiscard]] std::unique_ptr<Persistent> CreateCopy() const override { return std::make_unique<XmlObject>(*this); }

  /// Empties the lists, the name and the value.
  void Clear();

  // ---- file and text

  /// Replaces this object by the file's content. False when the file does not open, is empty or has no element at
  /// `index`; parse errors are thrown. `scrambled`: the file is in the scrambled form. A negative `index` takes the
  /// first top-level element; 0 and above the one at that position. `wrap`: this object becomes "xmlIndex" with the
  /// top-level elements (all, or the one at `index`) as children.
  bool LoadFromFile(const std::string& path, bool scrambled, bool wrap, int index);

  /// Writes the tree, replacing the file. True also when the file could not be written: see TrySaveToFile.
  bool SaveToFile(const std::string& path, bool scrambled, bool compact) const;

  /// As SaveToFile, and says whether it worked. The file's old content is kept when it did not.
  bool TrySaveToFile(const std::string& path, bool scrambled, bool compact) const;

  /// `compact`: without indentation and line feeds.
  [[nodiscard]] std::string ToString(bool compact) const;

  // ---- attributes; names are compared without regard to ASCII case
  [[nodiscard]] std::string GetAttributeValue(std::string_view attribute, std::string_view defaultValue) const;

  /// Null when there is none. Good until the attributes change.
  [[nodiscard]] XmlAttribute* FindAttribute(std::string_view attribute);
  [[nodiscard]] const XmlAttribute* FindAttribute(std::string_view attribute) const;

  /// Sets or appends; the value is cut before its first byte that is no XML character.
  XmlAttribute* SetAttribute(std::string_view attribute, const char* newValue);
  XmlAttribute* SetAttribute(std::string_view attribute, const std::string& newValue);
  XmlAttribute* SetAttribute(std::string_view attribute, int newValue);
  XmlAttribute* SetAttribute(std::string_view attribute, double newValue);
  void RemoveAttribute(std::string_view attribute);

  [[nodiscard]] std::string GetDeclarationValue(std::string_view attribute, std::string_view defaultValue) const;
  [[nodiscard]] XmlAttribute* FindDeclaration(std::string_view attribute);
  XmlAttribute* SetDeclaration(std::string_view attribute, const std::string& newValue);
  void RemoveDeclaration(std::string_view attribute);

  // ---- children; a pointer to a child is good until the list of its parent changes
  [[nodiscard]] unsigned int GetNumberOfObjects() const { return static_cast<unsigned int>(children.size()); }

  /// The index is not checked.
  [[nodiscard]] XmlObject* GetObjectAt(unsigned int index) { return &children[index]; }

  /// Appends a copy and returns it.
  XmlObject* AddChild(const XmlObject& child);
  XmlObject* AddChild(XmlObject&& child);
  void RemoveChildren(std::string_view childName);
  [[nodiscard]] std::list<XmlObject*> FindChildren(std::string_view childName);

  // ---- queries

  /// A filter without "=" is compared with the element's text; otherwise it is a list of key='value' pairs:
  /// @k @#k @!k @*k (attribute equals, contains, differs, exists), $k $#k $!k $*k (the same of a property child),
  /// k #k !k *k (child's text equals, contains, does not contain or is absent, child exists). All must pass.
  [[nodiscard]] bool Matches(const std::string& filter);

  /// Elements at `path` (names separated by "/", ".", "..", "name[filter]") that match `filter`, in document order.
  [[nodiscard]] std::list<XmlObject*> FindAll(const std::string& path, const std::string& filter);

  /// The first of these, or null.
  [[nodiscard]] XmlObject* FindFirstMatch(const std::string& path, const std::string& filter);

  /// Text of a child, or with a last part "@name" an attribute, at the end of a path.
  [[nodiscard]] std::string GetValue(const std::string& path, const std::string& defaultValue);

  /// Loads a file and returns the text of the first inner child `innerName` of a child `outerName` (both without
  /// regard to case); empty when nothing matches.
  static std::string GetValueFromFile(const std::string& path, const std::string& outerName,
                                      const std::string& innerName);

  // ---- properties: <property name=".." caption=".." value=".."/>

  /// `kind` adds one attribute with the value "1": 1 "logical", 3 "techDetail", 4 "hexData".
  XmlObject* AddProperty(const std::string& property, const std::string& caption, const std::string& propertyValue,
                         int kind);

  template <class Number>
  requires std::is_arithmetic_v<Number> XmlObject* AddProperty(const std::string& property,
                                                               const std::string& caption, Number propertyValue,
                                                               int kind) {
    std::ostringstream text;
    text << +propertyValue;
    return AddProperty(property, caption, text.str(), kind);
  }

  // ---- what stands before the tag; nearly no element has any of it
  struct Prolog {
    XmlList<XmlAttribute> declaration;      // of an <?xml ... ?> line
    std::vector<std::string> instructions;  // other <? ... ?> texts with their delimiters
  };
  [[nodiscard]] const Prolog& GetProlog() const;
  [[nodiscard]] Prolog& GetProlog();

  XmlText name;                      // the tag; empty for a wrapper without a tag
  XmlText value;                     // the element's text, decoded
  XmlObject* parent = nullptr;       // not owned
  int depth = 0;                     // 0 for a root
  XmlList<XmlAttribute> attributes;  // in document order
  XmlList<XmlObject> children;

 private:
  friend class XmlParser;

  void WriteTo(optstream& out);
  void ReadFrom(iptstream& in);
  void CopyContent(const XmlObject& other);

  // After a move the children stay where they are; only their way up has changed.
  void LinkChildren() noexcept {
    for (XmlObject& child : children) {
      child.parent = this;
    }
  }
  void Relink();
  void Write(std::string& out, bool compact) const;
  [[nodiscard]] bool PassesPair(std::string_view key, std::string_view wanted) const;
  [[nodiscard]] bool PassesAttribute(char form, std::string_view attribute, std::string_view wanted) const;
  [[nodiscard]] bool PassesProperty(char form, std::string_view property, std::string_view wanted) const;
  [[nodiscard]] bool PassesChild(char form, std::string_view child, std::string_view wanted) const;

  std::unique_ptr<Prolog> prolog;  // null when there is nothing
};

/// Writes the tree with indentation.
std::ostream& operator<<(std::ostream& stream, const XmlObject& object);

}  // namespace panelglow
