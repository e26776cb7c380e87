// Object streams: the bytes, objects that are there once, and streams that lie.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "config/ClassRegistration.h"
#include "config/XmlObject.h"
#include "config/iptstream.h"
#include "config/optstream.h"

namespace panelglow {
namespace {

using testing::HasSubstr;

// ---- building blocks of streams

std::string N(std::uint32_t number) {
  return {static_cast<char>(number), static_cast<char>(number >> 8U), static_cast<char>(number >> 16U),
          static_cast<char>(number >> 24U)};
}
std::string S(const std::string& text) { return N(static_cast<std::uint32_t>(text.size())) + text; }
const std::string kNull("\0", 1);
std::string Reference(std::uint32_t number) { return "\1" + N(number); }
std::string Value(std::uint32_t number, const std::string& payload) { return "\2" + N(number) + N(0) + payload; }
std::string Pointer(std::uint32_t number, const std::string& className, const std::string& payload) {
  return "\3" + N(number) + S(className) + N(0) + payload;
}
// An element without attributes, declaration and instructions.
std::string Element(const std::string& name, const std::string& parent, std::uint32_t children,
                    const std::string& records) {
  return S(name) + S("") + parent + N(0) + N(0) + N(0) + N(0) + N(children) + records;
}

template <class Write>
std::string Written(Write write) {
  std::ostringstream bytes;
  optstream out(bytes);
  write(out);
  return bytes.str();
}

// What reading a value of XmlObject throws.
std::string FailureOf(const std::string& stream) {
  std::istringstream bytes(stream);
  iptstream in(bytes);
  XmlObject object;
  try {
    in.ReadValue(object);
  } catch (const std::runtime_error& failure) {
    EXPECT_THROW(in.ReadUnsigned(), std::runtime_error);
    return failure.what();
  }
  return "";
}

// A class with pointers, as a graph has them.
class Node : public Persistent {
 public:
  explicit Node(int nodeId = 0) : id(nodeId) {}
  void ReadAndWrite(ptstream& stream, Direction direction, unsigned int /*version*/) override {
    if (direction == Direction::kWrite) {
      dynamic_cast<optstream&>(stream).WriteInteger(id);
      dynamic_cast<optstream&>(stream).WritePointer(next);
    } else {
      id = dynamic_cast<iptstream&>(stream).ReadInteger();
      dynamic_cast<iptstream&>(stream).ReadPointer(next);
    }
  }
  void CopyFrom(const Persistent* other) override { *this = dynamic_cast<const Node&>(*other); }
  [[nodiscard]] std::string GetRealClassName() const override { return "Node"; }
  [[nodiscard]] std::unique_ptr<Persistent> CreateCopy() const override { return std::make_unique<Node>(*this); }

  int id;
  Persistent* next = nullptr;
};
const bool kNodeIsRegistered = RegisterClass<Node>("Node");

class Proxied : public PersistentByProxy {
 public:
  void ReadAndWrite(ptstream& stream, Direction direction, unsigned int version) override {
    if (direction == Direction::kWrite) {
      dynamic_cast<optstream&>(stream).WriteCString(text.c_str());
    } else {
      dynamic_cast<iptstream&>(stream).ReadString(text);
      text += " of version " + std::to_string(version);
    }
  }
  [[nodiscard]] unsigned int Version() const override { return 3; }
  void CopyFrom(const PersistentByProxy* other) override { text = dynamic_cast<const Proxied&>(*other).text; }
  [[nodiscard]] std::unique_ptr<PersistentByProxy> CreateCopy() const override {
    return std::make_unique<Proxied>(*this);
  }
  [[nodiscard]] std::string GetRealClassName() const override { return "Proxied"; }

  std::string text;
};
const bool kProxiedIsRegistered = RegisterClass(
    {"Proxied", nullptr, []() -> std::unique_ptr<PersistentByProxy> { return std::make_unique<Proxied>(); }});

// ---- the bytes

TEST(ObjectStream, WritesATreeByteByByteAndAnObjectThatIsThereAsFiveBytes) {
  XmlObject tree("<?xml version=\"1.0\"?><?go?><a b='c'>t<d/></a>");
  const std::string child =
      Value(3, S("d") + S("") + Reference(0) + N(1) + N(0) + N(0) + N(0) + N(0));  // number 0 is its parent
  const std::string root = Value(0, S("a") + S("t") + kNull + N(0) + N(1) + Value(1, S("b") + S("c")) + N(1) +
                                        Value(2, S("version") + S("1.0")) + N(1) + S("<?go?>") + N(1) + child);
  EXPECT_EQ(Written([&](optstream& out) { out.WriteValue(tree); }), root);
  EXPECT_EQ(Written([&](optstream& out) {
              out.WriteValue(tree);
              out.WriteValue(tree);
              out.WritePointer(&tree.children[0]);
              out.WritePointer(static_cast<Persistent*>(nullptr));
            }),
            root + Reference(0) + Reference(3) + kNull);
  EXPECT_EQ(Written([&](optstream& out) { out.WritePointer(&tree.attributes[0]); }),
            Pointer(0, "XmlAttribute", S("b") + S("c")));
  // A part does not take its tree along.
  EXPECT_EQ(Written([&](optstream& out) { out.WriteValue(tree.children[0]); }),
            Value(0, S("d") + S("") + kNull + N(1) + N(0) + N(0) + N(0) + N(0)));
}

// ---- round trips

// Writes the tree as a value, reads it, and says what came back: its text, and its stream once more.
std::string RoundTrip(XmlObject& tree) {
  const std::string stream = Written([&](optstream& out) { out.WriteValue(tree); });
  std::istringstream bytes(stream);
  iptstream in(bytes);
  XmlObject read;
  in.ReadValue(read);
  EXPECT_EQ(Written([&](optstream& out) { out.WriteValue(read); }), stream);
  EXPECT_EQ(bytes.peek(), std::istream::traits_type::eof());
  return read.ToString(false);
}

XmlObject RandomTree(std::mt19937& random, int levels) {
  const auto text = [&](std::size_t longest) {
    std::string bytes(random() % (longest + 1), ' ');
    for (char& c : bytes) {
      c = static_cast<char>(random() % 256);
    }
    return bytes;
  };
  XmlObject tree;
  tree.name = "n" + text(20);
  tree.value = text(random() % 50 == 0 ? 100000 : 20);
  for (std::size_t i = random() % 4; i > 0; --i) {
    tree.SetAttribute("a" + std::to_string(i), text(20));
    tree.GetProlog().instructions.push_back(text(5));
    tree.SetDeclaration("d" + std::to_string(i), text(5));
  }
  for (std::size_t i = levels > 0 ? random() % 4 : 0; i > 0; --i) {
    tree.AddChild(RandomTree(random, levels - 1));
  }
  return tree;
}

TEST(ObjectStream, AnyTreeComesBackAsItWas) {
  std::mt19937 random(7);
  for (int i = 0; i < 50; ++i) {
    XmlObject tree = RandomTree(random, 5);
    EXPECT_EQ(RoundTrip(tree), tree.ToString(false));
  }
  XmlObject deep;
  XmlObject* innermost = &deep;
  for (int i = 0; i < XmlObject::kDeepestElement; ++i) {
    innermost = innermost->AddChild(XmlObject());
    innermost->name = "d";
  }
  innermost->SetAttribute("a", "b");
  EXPECT_EQ(RoundTrip(deep), deep.ToString(false));
  XmlObject wide;  // its list moves as its items come in
  for (int i = 0; i < 300; ++i) {
    wide.AddChild(XmlObject())->value = std::to_string(i);
    wide.SetAttribute("a" + std::to_string(i), i);
  }
  EXPECT_EQ(RoundTrip(wide), wide.ToString(false));
  innermost->AddChild(deep);
  EXPECT_THROW(Written([&](optstream& out) { out.WriteValue(deep); }), std::runtime_error);
}

TEST(ObjectStream, AnElementKeepsThePlaceThatItIsReadInto) {
  XmlObject source("<a><b><c/></b></a>");
  const std::string stream = Written([&](optstream& out) { out.WriteValue(source.children[0]); });
  std::istringstream bytes(stream);
  iptstream in(bytes);
  XmlObject tree("<x><y><z/></y></x>");
  XmlObject& place = tree.children[0];
  in.ReadValue(place);
  EXPECT_EQ(tree.ToString(true), "<x><b><z/><c/></b></x>");
  EXPECT_EQ(place.parent, &tree);
  EXPECT_EQ(place.children[1].parent, &place);
  EXPECT_EQ(place.children[0].parent, &place);
  EXPECT_EQ(place.children[1].depth, 2);
}

// ---- pointers

TEST(ObjectStream, APointerFollowsItsObjectToTheElementThatHoldsIt) {
  XmlObject tree("<a><b i='1'><c/></b></a>");
  const std::string stream = Written([&](optstream& out) {
    out.WritePointer(&tree.children[0]);
    out.WritePointer(&tree.children[0].children[0]);
    out.WriteValue(tree);
    out.WritePointer(&tree.children[0].attributes[0]);
    out.WritePointer(&tree);
    out.WritePointer(&tree.children[0]);
  });
  std::istringstream bytes(stream);
  iptstream in(bytes);
  Persistent* child = nullptr;
  Persistent* grandchild = nullptr;
  in.ReadPointer(child);
  in.ReadPointer(grandchild);
  EXPECT_NE(child, nullptr);
  XmlObject read;
  in.ReadValue(read);
  EXPECT_EQ(read.ToString(true), tree.ToString(true));
  EXPECT_EQ(child, &read.children[0]);
  EXPECT_EQ(grandchild, &read.children[0].children[0]);
  EXPECT_EQ(in.LookAtPointer(), &read.children[0].attributes[0]);
  EXPECT_EQ(in.LookAtPointer(), &read);
  EXPECT_EQ(in.LookAtPointer(), child);
  EXPECT_EQ(in.Take(child), nullptr);  // it belongs to its tree now
}

// What an element is read into twice has the parts of both; those of the first have moved.
TEST(ObjectStream, APointerFollowsAPartOfAnElementThatIsReadIntoAgain) {
  std::stringstream bytes;
  XmlObject one("<a><c/></a>");
  XmlObject two("<b><d/><e/><f/></b>");
  optstream out(bytes);
  out.WriteValue(one);
  out.WriteValue(two);
  out.WritePointer(one.GetObjectAt(0));
  XmlObject three("<g/>");
  out.WriteValue(three);
  out.WriteValue(three);

  XmlObject read;
  XmlObject other;
  iptstream in(bytes);
  in.ReadValue(read);
  in.ReadValue(read);
  Persistent* part = nullptr;
  in.ReadPointer(part);
  ASSERT_EQ(read.children.size(), 4U);
  EXPECT_EQ(part, read.GetObjectAt(0));
  in.ReadValue(other);
  EXPECT_THROW(in.ReadValue(read), std::exception) << "the parts that the stream knows would go";
}

TEST(ObjectStream, CyclesAndSharedObjectsKeepTheirShape) {
  Node first(1);
  Node second(2);
  first.next = &second;
  second.next = &first;
  Node third(3);
  third.next = &third;
  const std::string stream = Written([&](optstream& out) {
    out.WriteValue(first);
    out.WritePointer(&second);
    out.WritePointer(&third);
  });
  EXPECT_EQ(stream, Value(0, N(1) + Pointer(1, "Node", N(2) + Reference(0))) + Reference(1) +
                        Pointer(2, "Node", N(3) + Reference(2)));
  Node read;
  std::unique_ptr<Persistent> kept;
  {
    std::istringstream bytes(stream);
    iptstream in(bytes);
    in.ReadValue(read);
    auto* other = dynamic_cast<Node*>(read.next);
    ASSERT_NE(other, nullptr);
    EXPECT_EQ(other->id, 2);
    EXPECT_EQ(other->next, &read);
    Persistent* again = nullptr;
    in.ReadPointer(again);
    EXPECT_EQ(again, other);
    kept = in.Take(in.LookAtPointer());
  }
  EXPECT_EQ(dynamic_cast<Node&>(*kept).id, 3);
  EXPECT_EQ(dynamic_cast<Node&>(*kept).next, kept.get());
}

TEST(ObjectStream, AProxyStandsForAClassThatIsNoPersistent) {
  Proxied object;
  object.text = "text";
  const std::string stream = Written([&](optstream& out) {
    out.WritePointer(&object);
    out.WritePointer(&object);
    out.WriteValue(object);
  });
  const std::string payload = N(3) + S("text");
  EXPECT_EQ(stream, "\3" + N(0) + S("Proxied") + payload + Reference(0) + Reference(0));
  std::istringstream bytes(stream);
  iptstream in(bytes);
  PersistentByProxy* pointer = nullptr;
  PersistentByProxy* same = nullptr;
  in.ReadPointer(pointer);
  in.ReadPointer(same);
  ASSERT_NE(pointer, nullptr);
  EXPECT_EQ(same, pointer);
  Proxied home;
  in.ReadValue(home);
  EXPECT_EQ(home.text, "text of version 3");
  EXPECT_EQ(pointer, &home);
  // What is stored may be of any version: the class is told and decides.
  for (const std::uint32_t version : {0U, 4U}) {
    std::istringstream stored("\2" + N(0) + N(version) + S("text"));
    iptstream(stored).ReadValue(home);
    EXPECT_EQ(home.text, "text of version " + std::to_string(version));
  }
}

// ---- streams that lie

TEST(ObjectStream, SaysWhatIsWrongWithAStream) {
  const std::string leaf = Element("l", kNull, 0, "");
  const std::pair<std::string, const char*> kCases[] = {
      {"", "The stream ends too early"},
      {kNull, "Invalid byte value"},
      {Pointer(0, "XmlObject", leaf), "Invalid byte value"},
      {"\4", "Invalid byte value"},
      {Reference(0), "Indexed object not found."},
      {Value(0, Element("a", "\2" + N(1), 0, "")), "Invalid byte value"},
      {Value(0, Element("a", Reference(1), 0, "")), "Indexed object not found."},
      {Value(0, Element("a", Pointer(1, "XmlThing", ""), 0, "")),
       "Attempting to stream ungegistered class: XmlThing"},
      {Value(0, Element("a", Pointer(1, "Proxied", ""), 0, "")), "Attempting to stream ungegistered class: Proxied"},
      {Value(1, leaf), "Object number 1 where 0 is next"},
      {Value(0, Element("a", kNull, 1, Value(0, leaf))), "Object number 0 where 1 is next"},
      {Value(0, Element("a", kNull, 1, Reference(0))), "Indexed object is still being read."},
      {Value(0, Element("a", Pointer(1, "XmlAttribute", S("n") + S("v")), 1, Reference(1))),
       "Indexed object is of another class: XmlAttribute"},
      {Value(0, Element("a", kNull, 2, Value(1, leaf) + Reference(1))), "Indexed object has another place already."},
      {Value(0, Element("a", Pointer(1, "XmlObject", leaf), 2, Reference(1) + Reference(1))),
       "Indexed object has another place already."},
      {Value(0, N(0xFFFFFFFF) + "abc"), "The stream ends too early"},
      {Value(0, Element("a", kNull, 0xFFFFFFFF, Value(1, leaf))), "The stream ends too early"},
      {Value(0, S("a") + S("") + kNull + N(0) + N(0xFFFFFFFF)), "The stream ends too early"},
      {Value(0, S("a") + S("") + kNull + N(0) + N(0) + N(0) + N(0xFFFFFFFF) + S("x")), "The stream ends too early"},
  };
  for (const auto& [stream, message] : kCases) {
    EXPECT_EQ(FailureOf(stream), message);
  }
  EXPECT_EQ(FailureOf(Value(0, leaf)), "");
}

TEST(ObjectStream, NestingIsBoundedHoweverItIsMade) {
  std::string nested;  // elements in elements
  std::string chain;   // parents of parents
  std::string moved;   // each object made for a pointer, then placed in the next one
  for (std::uint32_t i = 0; i < 3000; ++i) {
    nested += "\2" + N(i) + N(0) + S("") + S("") + kNull + N(0) + N(0) + N(0) + N(0) + N(1);
    chain += (i == 0 ? "\2" + N(0) : "\3" + N(i) + S("XmlObject")) + N(0) + S("") + S("");
    moved += Value(2 * i + 1, Element("",
                                      Pointer(2 * i + 2, "XmlObject",
                                              Element("", kNull, i == 0 ? 0 : 1, i == 0 ? "" : Reference(2 * i))),
                                      0, ""));
  }
  for (const std::string& stream : {nested, chain}) {
    EXPECT_THAT(FailureOf(stream), HasSubstr("nested deeper than 1100 levels"));
  }
  // Each object of the last finds its place in the parent of the next element.
  EXPECT_THAT(FailureOf(Value(0, Element("", kNull, 3000, moved))), HasSubstr("nested deeper than 1100 levels"));
}

TEST(ObjectStream, CutOrChangedStreamsNeverDoWorseThanFail) {
  std::mt19937 random(11);
  XmlObject tree = RandomTree(random, 3);
  const std::string good = Written([&](optstream& out) {
    out.WritePointer(&tree);
    out.WriteValue(tree);
  });
  const auto isRead = [](const std::string& stream) {
    std::istringstream bytes(stream);
    iptstream in(bytes);
    Persistent* pointer = nullptr;
    XmlObject value;
    try {
      in.ReadPointer(pointer);
      in.ReadValue(value);
    } catch (const std::runtime_error&) {
      return pointer != nullptr;  // after a failure it leads nowhere
    }
    return true;
  };
  EXPECT_TRUE(isRead(good));
  for (std::size_t length = 0; length < good.size(); length += 1 + length / 500) {
    EXPECT_FALSE(isRead(good.substr(0, length))) << length;
  }
  for (int i = 0; i < 3000; ++i) {
    std::string changed = good;
    changed[random() % std::min<std::size_t>(good.size(), 2000)] = static_cast<char>(random() % 256);
    changed[random() % std::min<std::size_t>(good.size(), 2000)] = static_cast<char>(random() % 5);
    isRead(changed);
  }
}

}  // namespace
}  // namespace panelglow
