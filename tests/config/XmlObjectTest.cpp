#include "config/XmlObject.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>
#include <stdexcept>
#include <string>
#include <utility>

#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::sim::MachineDescription;
using platform::sim::Simulation;
using testing::HasSubstr;

XmlObject Parsed(const std::string& text) { return XmlObject(text); }

std::string ErrorOf(const std::string& text) {
  try {
    XmlObject object(text);
  } catch (const std::runtime_error& error) {
    return error.what();
  }
  return {};
}

// ---- parsing

TEST(XmlObject, ReadsWhatItKnowsAndDropsTheRest) {
  const std::pair<const char*, const char*> kCases[] = {
      {"<a/>", "<a/>"},
      {"  <a></a> behind", "<a/>"},
      {"<a>   \n</a>", "<a/>"},
      {"<a>x<b/>y</a>", "<a>x<b/></a>"},
      {"<a><b/>y</a>", "<a><b/></a>"},
      {"<a></b>", "<a/>"},
      {"<a></a    >", "<a/>"},
      {"< a/>", "<a/>"},
      {"<a1-b.c/>", "<a1-b.c/>"},
      {"<a b='1' b=\"2\" B='3'/>", "<a b=\"3\"/>"},
      {"<a b='1' b='&lt;'/>", "<a b=\"&lt;\"/>"},
      {"<\xC3\xA4 \xC3\xB6='1'/>", "<\xC3\xA4 \xC3\xB6=\"1\"/>"},
      {"<a b = '1'\tc\n=\n\"2\"/>", "<a b=\"1\" c=\"2\"/>"},
      {"<a b='it\"s' c=\"it's\"/>", "<a b=\"it&quot;s\" c=\"it's\"/>"},
      {"<a b/>", "<a/>"},
      {"<a b='1>2'/>", "<a/>"},
      {"<a b='1&gt;2'/>", "<a b=\"1&gt;2\"/>"},
      {"<a>x/>y</a>", "<a/>"},
      {"<a>&lt;&gt;&amp;&quot;&apos;&#09;&#10;&#13;&#x41;&unknown;&amp</a>",
       "<a>&lt;&gt;&amp;\"'&#09;&#10;&#13;&amp;#x41;&amp;unknown;&amp;amp</a>"},
      {"<a b='&amp;lt;&lt;'/>", "<a b=\"&amp;lt;&lt;\"/>"},
      {"<a b='x\x01y' c='z'/>", "<a b=\"x\" c=\"z\"/>"},
      {"<a>caf\xC3\xA9 \xFF</a>", "<a>caf\xC3\xA9 \xFF</a>"},
      {"<?xml encoding='x' version='1.1'?><a/>", "<?xml version=\"1.1\" encoding=\"x\"?>\n<a/>"},
      {"<?pi 1?><a><?pi 2?><b/></a>", "<?pi 1?>\n<a><?pi 2?>\n<b/></a>"},
      {"", ""},
      {" \n", ""},
      {"<!-- nothing -->", ""},
      // comments, which count everywhere
      {"<!-- <b> --><a/>", "<a/>"},
      {"<a><!-- </a> --><b/></a>", "<a><b/></a>"},
      {"<a>x<!-- <!-- nested --> still hidden -->y</a>", "<a>xy</a>"},
      {"<a b='x<!-- > ' -->y'/>", "<a b=\"xy\"/>"},
      {"<a <!-- c='3' --> b='1'/>", "<a b=\"1\"/>"},
      {"<a b<!-- -->=<!-- -->'1'/>", "<a b=\"1\"/>"},
      {"<a><!-- only --></a>", "<a/>"},
      {"<a>x<!--->y--></a>", "<a>x</a>"},
      {"<a b='x<!--->y-->'/>", "<a b=\"x\"/>"},
      {"<a <!-- -->>x</a>", "<a>x</a>"},
      {"<a>x-->y</a>", "<a>xy</a>"},
      {"<a b='x-->y'/>", "<a b=\"xy\"/>"},
      {"<a b='x<!--hidden-->y-->z-->'/>", "<a b=\"xyz\"/>"},
      {"<a>1 - 2 -- 3</a>", "<a>1 - 2 -- 3</a>"},
      {"<a/><!-- never closed", "<a/>"},
  };
  for (const auto& [text, written] : kCases) {
    EXPECT_EQ(Parsed(text).ToString(true), written) << text;
  }
}

TEST(XmlObject, RefusesMalformedTextWithPlaceReasonAndTheElementSoFar) {
  const std::string head = "XML Parsing Error (line ";
  const std::pair<const char*, const char*> kCases[] = {
      {"x", "1, position 1) Left angle bracket character expected"},
      {"\n\n <?pi", "3, position 2) Missing end tag: <?"},
      {"<_a/>", "1, position 4) Invalid tag name"},
      {"<1a />", "1, position 4) Invalid tag name: 1a"},
      {"<>", "1, position 2) Invalid tag name"},
      {"<a><?pi?></a>", "1, position 13) Invalid tag name<?pi?>\n"},
      {"<a 1b='x'/>", "1, position 6) Invalid attribute name: 1b<a/>\n"},
      {"<a b c='1'/>", "1, position 6) Equal chracter expected: c attribute value: b tag value: a<a/>\n"},
      {"<a x='1' b=c/>",
       "1, position 12) Single or double quote expected: c attribute: b tag value: a\n\n\n<a x=\"1\"/>\n"},
      {"<r>\n<a>v<b/>\n</a", "3, position 1) Missing Right Angle Bracket Character<a>v  <b/>\n</a>\n"},
      {"<a", "1, position 2) Missing end tag: a"},
      {"<a <!-- -->", "1, position 11) Missing end tag: a<a/>\n"},
      {"<r><a b='1'>text", "1, position 16) Missing end tag: a<a b=\"1\"/>\n"},
      {"<a><!-- </a>", "1, position 12) Missing end tag: a<a/>\n"},
      {"<a b='unclosed", "1, position 14) Missing end tag: a<a/>\n"},
  };
  for (const auto& [text, rest] : kCases) {
    EXPECT_EQ(ErrorOf(text), head + rest) << text;
  }
}

TEST(XmlObject, EndsTheTextAtItsFirstNul) {
  EXPECT_EQ(Parsed(std::string("<a/>\0<", 6)).ToString(true), "<a/>");
  EXPECT_THAT(ErrorOf(std::string("<a b='\0'/>", 10)), HasSubstr("Missing end tag: a"));
}

TEST(XmlObject, ParsesOrRefusesATextCutAtAnyByte) {
  const std::string text =
      "<?xml version='1.0'?><!-- <!-- c --> --><r a='1&lt;<!-- x -->2' b=\"3\"><?pi?><s>t-->e&amp;x</s><t "
      "u='v'/></r>";
  int whole = 0;
  for (std::size_t length = 0; length <= text.size(); ++length) {
    const std::string cut = text.substr(0, length);
    whole += ErrorOf(cut).empty() && !XmlObject(cut).name.empty() ? 1 : 0;
  }
  EXPECT_EQ(whole, 1);  // only the uncut text holds an element
}

TEST(XmlObject, SurvivesBytesThatWereMixedUp) {
  const std::string alphabet = "<<>>//ab='\"!-- ?&;\n\x01\xFF";
  std::mt19937 random(7);
  for (int i = 0; i < 20000; ++i) {
    std::string text = "<a>";
    for (std::size_t k = random() % 40; k > 0; --k) {
      text += alphabet[random() % alphabet.size()];
    }
    if (ErrorOf(text).empty()) {
      const XmlObject tree(text);
      EXPECT_EQ(ErrorOf(tree.ToString(true)), "") << text;
    }
  }
}

TEST(XmlObject, TakesThousandLevelsAndRefusesMore) {
  const auto nested = [](int levels) {
    std::string text;
    for (int i = 0; i < levels; ++i) {
      text += "<a>";
    }
    for (int i = 0; i < levels; ++i) {
      text += "</a>";
    }
    return text;
  };
  const XmlObject deepest(nested(XmlObject::kDeepestElement + 1));
  const XmlObject copy = deepest;
  EXPECT_EQ(copy.ToString(true), deepest.ToString(true));
  EXPECT_THAT(ErrorOf(nested(XmlObject::kDeepestElement + 2)), HasSubstr("nested deeper than 1000 levels"));
  EXPECT_THAT(ErrorOf(nested(100'000)), HasSubstr("nested deeper than 1000 levels"));
  EXPECT_FALSE(ErrorOf(std::string(3'000'000, '<')).empty());
}

TEST(XmlObject, TakesManySiblingsAndManyAttributesInLinearTime) {
  constexpr unsigned kMany = 300'000;  // a quadratic step would take minutes
  std::string text = "<r>";
  for (unsigned i = 0; i < kMany; ++i) {
    text += "<c n='x'/>";
  }
  text += "<d";
  for (unsigned i = 0; i < kMany; ++i) {
    text += " a" + std::to_string(i % (kMany / 2)) + "='" + std::to_string(i) + "'";
  }
  XmlObject tree(text + "/></r>");
  ASSERT_EQ(tree.GetNumberOfObjects(), kMany + 1);
  EXPECT_EQ(tree.GetObjectAt(kMany)->attributes.size(), kMany / 2);
  EXPECT_EQ(tree.GetObjectAt(kMany)->attributes.front().value, std::to_string(kMany / 2));
  XmlObject grown;
  for (const XmlObject& child : tree.children) {
    grown.AddChild(child);
  }
  EXPECT_EQ(grown.children[kMany / 2].parent, &grown);
}

// ---- writing

// `mixed`: elements with both text and children, whose text grows when they are written with indentation.
XmlObject RandomTree(std::mt19937& random, int levels, bool mixed) {
  const auto word = [&](std::string_view alphabet, std::size_t longest) {
    std::string text;
    for (std::size_t k = random() % (longest + 1); k > 0; --k) {
      text += alphabet[random() % alphabet.size()];
    }
    return text;
  };
  constexpr std::string_view kText = "abc <>&\"'-\t\n\r/=\xC3\xA9!";
  XmlObject object;
  object.name = "n" + word("xyz._:0", 20);
  for (std::size_t i = random() % 4; i > 0; --i) {
    object.SetAttribute("a" + word("bc", 2), word(kText, 20));
  }
  for (std::size_t i = levels > 0 ? random() % 4 : 0; i > 0; --i) {
    object.AddChild(RandomTree(random, levels - 1, mixed));
  }
  if (mixed || object.children.empty()) {
    object.value = word("x", 1) + word(kText, 30) + "y";  // a text of blanks alone would not survive
  }
  return object;
}

TEST(XmlObject, ReadsAgainWhatItWrote) {
  std::mt19937 random(1);
  for (int i = 0; i < 300; ++i) {
    const bool compact = i % 2 == 0;
    const std::string written = RandomTree(random, 4, compact).ToString(compact);
    EXPECT_EQ(Parsed(written).ToString(compact), written);
  }
}

TEST(XmlObject, IndentsByDepthAndEscapesByPlace) {
  XmlObject tree("<r><s a='&lt;&quot;&#10;'>\"t\"</s><u><v/></u></r>");
  EXPECT_EQ(tree.ToString(false), "<r>\n  <s a=\"&lt;&quot;&#10;\">\"t\"</s>\n  <u>\n    <v/>\n  </u>\n</r>\n");
  EXPECT_EQ(tree.GetObjectAt(1)->ToString(false), "  <u>\n    <v/>\n  </u>\n");
  tree.SetDeclaration("encoding", "UTF-8");
  tree.AddChild(XmlObject("<?xml version='1.0'?><w/>"));  // only a root's declaration is written
  EXPECT_THAT(tree.ToString(true), testing::StartsWith("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<r>"));
  EXPECT_THAT(tree.ToString(true), testing::EndsWith("<w/></r>"));
}

// ---- the tree

// Every child must know its parent and depth, however the tree came about.
void ExpectLinked(const XmlObject& object) {
  for (const XmlObject& child : object.children) {
    ASSERT_EQ(child.parent, &object);
    ASSERT_EQ(child.depth, object.depth + 1);
    ExpectLinked(child);
  }
}

TEST(XmlObject, KeepsParentsAndDepthsThroughEveryChange) {
  const XmlObject sample("<a><b><c/><c/></b><d/><b/></a>");
  XmlObject tree;
  for (int i = 0; i < 9; ++i) {  // sisters move when the list grows
    ExpectLinked(*tree.AddChild(sample));
    ExpectLinked(tree);
  }
  tree.GetObjectAt(3)->RemoveChildren("b");
  ExpectLinked(tree);
  XmlObject copy = *tree.GetObjectAt(1);
  EXPECT_EQ(copy.parent, nullptr);
  EXPECT_EQ(copy.depth, 0);
  ExpectLinked(copy);
  *tree.GetObjectAt(2) = sample;  // an element that is assigned to keeps its place
  ExpectLinked(tree);
  copy.CopyFrom(&tree);
  ExpectLinked(copy);
  copy.CopyFrom(&copy);
  EXPECT_EQ(copy.GetNumberOfObjects(), 9U);
  XmlAttribute other("a", "b");
  copy.CopyFrom(&other);  // of another class
  other.CopyFrom(&copy);
  EXPECT_EQ(copy.GetNumberOfObjects(), 9U);
  EXPECT_EQ(other.value, "b");
  copy.attributes.emplace_back().CopyFrom(&other);
  EXPECT_EQ(copy.GetAttributeValue("a", ""), "b");
  copy = std::move(*copy.GetObjectAt(4));  // out of its own subtree
  EXPECT_EQ(copy.ToString(true), sample.ToString(true));
  ExpectLinked(copy);
  copy.Clear();
  EXPECT_EQ(copy.ToString(true), "");
}

TEST(XmlObject, SetsFindsAndRemovesAttributesWithoutRegardToCase) {
  XmlObject object;
  object.SetAttribute("Name", "one\x02two");
  object.SetAttribute("NAME", std::string("three"));
  object.SetAttribute("int", -7);
  object.SetAttribute("double", 0.5);
  EXPECT_EQ(object.GetAttributeValue("name", ""), "three");
  EXPECT_EQ(object.GetAttributeValue("INT", ""), "-7");
  EXPECT_EQ(object.GetAttributeValue("double", ""), "0.5");
  EXPECT_EQ(object.GetAttributeValue("none", "default"), "default");
  object.attributes.emplace_back("nAmE", "again");
  object.RemoveAttribute("name");
  EXPECT_EQ(object.FindAttribute("Name"), nullptr);
  EXPECT_EQ(object.attributes.size(), 2U);
}

TEST(XmlObject, FindsAndSetsItsDeclaration) {
  XmlObject object("<?xml version='1.1'?><a/>");
  ASSERT_NE(object.FindDeclaration("version"), nullptr);
  EXPECT_EQ(object.FindDeclaration("version")->value, "1.1");
  EXPECT_EQ(object.FindDeclaration("encoding"), nullptr);
  object.SetDeclaration("encoding", "UTF-8");
  EXPECT_EQ(object.ToString(true), "<?xml version=\"1.1\" encoding=\"UTF-8\"?>\n<a/>");
}

TEST(XmlObject, HoldsTextsOfAnyLength) {
  for (const std::size_t length : {0U, 1U, 14U, 15U, 16U, 17U, 100'000U}) {
    const std::string text(length, 'x');
    XmlText kept = text;
    XmlText copy = kept;
    EXPECT_EQ(kept, text);
    EXPECT_EQ(kept.empty(), length == 0);
    kept = XmlText("other");
    EXPECT_EQ(std::string(copy), text);
    const XmlText moved = std::move(copy);
    EXPECT_EQ(moved, text);
  }
}

// ---- queries

TEST(XmlObject, MatchesFilters) {
  XmlObject object(
      "<e A='Alpha' Empty=''>text<property name='Size' value='Large'/><property "
      "name='p'/><k>Value</k><k>two</k></e>");
  const std::pair<const char*, bool> kCases[] = {
      {"", true},
      {"text", true},
      {"Text", false},
      {"@a='ALPHA'", true},
      {"@a='alph'", false},
      {"@none=''", true},
      {"@#a='LPH'", true},
      {"@#a='x'", false},
      {"@!a='beta'", true},
      {"@!a='alpha'", false},
      {"@!none=''", false},
      {"@*empty=''", true},
      {"@*none=''", false},
      {"$Size='large'", true},
      {"$Size='small'", false},
      {"$p=''", true},
      {"$#Size='ARG'", true},
      {"$!Size='small'", true},
      {"$!Size='large'", false},
      {"$*size=''", true},
      {"$*none=''", false},
      {"k='VALUE'", true},
      {"k='two'", true},
      {"K='two'", false},
      {"#k='alu'", true},
      {"#k='ALU'", false},
      {"!k='alu'", true},  // the second k does not contain it
      {"!k='x' ", true},
      {"!k=''", false},
      {"!none='x'", true},
      {"*k=''", true},
      {"*none=''", false},
      {"@a='alpha' k='two'", true},
      {"@a='alpha' k='three'", false},
      {"@a=\"al&#112;ha\"", false},  // not among the known entities
      {"k='&quot;' @a='alpha'", false},
  };
  for (const auto& [filter, matches] : kCases) {
    EXPECT_EQ(object.Matches(filter), matches) << filter;
  }
  EXPECT_THROW(static_cast<void>(object.Matches("@a=`x`")), std::runtime_error);
}

TEST(XmlObject, FindsElementsByPath) {
  XmlObject tree("<r><s id='1'><t>a</t><t>b</t></s><x/><s id='2'><t>c</t></s><S id='3'><t>d</t></S></r>");
  const auto found = [&](const char* path, const char* filter) {
    std::string texts;
    for (const XmlObject* element : tree.FindAll(path, filter)) {
      texts += element->value.empty() ? std::string(element->name) : std::string(element->value);
    }
    return texts;
  };
  EXPECT_EQ(found("s", ""), "ss");
  EXPECT_EQ(found("s/t", ""), "abc");
  EXPECT_EQ(found("s/t", "b"), "b");
  EXPECT_EQ(found("s[@id='2']/t", ""), "c");
  EXPECT_EQ(found("s[@id='2']", "@id='1'"), "");
  EXPECT_EQ(found("./x/../s[@id='1']/t", ""), "ab");
  EXPECT_EQ(found("..", ""), "");
  EXPECT_EQ(found(".", ""), "r");
  EXPECT_EQ(found("", ""), "");
  EXPECT_EQ(found("s/none/t", ""), "");
  EXPECT_EQ(tree.FindFirstMatch("s/t", ""), tree.GetObjectAt(0)->GetObjectAt(0));
  EXPECT_EQ(tree.FindFirstMatch("y", ""), nullptr);
  EXPECT_EQ(tree.GetValue("s/t", "-"), "a");
  EXPECT_EQ(tree.GetValue("s[@id='2']/@ID", "-"), "2");
  EXPECT_EQ(tree.GetValue("s/@none", "-"), "-");
  EXPECT_EQ(tree.GetValue("none/t", "-"), "-");
  EXPECT_EQ(tree.GetObjectAt(2)->GetValue("t", "-"), "c");
  EXPECT_EQ(tree.GetValue("none", "-"), "-");
}

TEST(XmlObject, AddsPropertiesOfEachKind) {
  XmlObject object;
  object.AddProperty("n", "c", "v", 0);
  object.AddProperty("n", "c", 255, 4);
  object.AddProperty("n", "c", std::uint8_t{65}, 1);
  object.AddProperty("n", "c", 1.5F, 3);
  EXPECT_EQ(object.ToString(true),
            "<property name=\"n\" caption=\"c\" value=\"v\"/>"
            "<property name=\"n\" caption=\"c\" value=\"255\" hexData=\"1\"/>"
            "<property name=\"n\" caption=\"c\" value=\"65\" logical=\"1\"/>"
            "<property name=\"n\" caption=\"c\" value=\"1.5\" techDetail=\"1\"/>");
}

// ---- files

class XmlFiles : public testing::Test {
 protected:
  Simulation machine_{MachineDescription{}, {}};
};

TEST_F(XmlFiles, LoadsOneOfSeveralTopLevelElements) {
  machine_.DiskFiles().Put("m.xml", "<?pi?><a x='1'/>\n<!-- c --><b><c/></b> <d/>\n ");
  const struct {
    bool wrap;
    int index;
    bool loaded;
    const char* written;
  } kCases[] = {
      {false, -1, true, "<?pi?>\n<a x=\"1\"/>"},
      {false, 0, true, "<?pi?>\n<a x=\"1\"/>"},
      {false, 1, true, "<b><c/></b>"},
      {false, 2, true, "<d/>"},
      {false, 3, false, ""},
      {true, -1, true, "<xmlIndex><?pi?>\n<a x=\"1\"/><b><c/></b><d/></xmlIndex>"},
      {true, 1, true, "<xmlIndex><b><c/></b></xmlIndex>"},
      {true, 3, false, "<xmlIndex/>"},
  };
  for (const auto& c : kCases) {
    XmlObject object("<old/>");
    EXPECT_EQ(object.LoadFromFile("m.xml", false, c.wrap, c.index), c.loaded) << c.wrap << c.index;
    EXPECT_EQ(object.ToString(true), c.written) << c.wrap << c.index;
    ExpectLinked(object);
  }
}

TEST_F(XmlFiles, LooksAtNothingBehindTheElementThatWasAskedFor) {
  machine_.DiskFiles().Put("m.xml", "<a/><b/><1/>");
  for (const bool wrap : {false, true}) {
    XmlObject object;
    EXPECT_TRUE(object.LoadFromFile("m.xml", false, wrap, 1));
    EXPECT_THROW(static_cast<void>(object.LoadFromFile("m.xml", false, wrap, 2)), std::runtime_error);
  }
}

TEST_F(XmlFiles, AttributesInsideAnElementThatIsPassedOverAreNotLookedAt) {
  machine_.DiskFiles().Put("m.xml", "<a><b c=d 1='>'/>text</a><e x='1'/><f c=d/><g/>");
  XmlObject object;
  EXPECT_TRUE(object.LoadFromFile("m.xml", false, false, 1));
  EXPECT_EQ(object.ToString(true), "<e x=\"1\"/>");
  EXPECT_THROW(static_cast<void>(object.LoadFromFile("m.xml", false, false, 0)), std::runtime_error);
  EXPECT_THROW(static_cast<void>(object.LoadFromFile("m.xml", false, false, 3)), std::runtime_error);  // its own are
}

TEST_F(XmlFiles, LeavesTheObjectAloneWhenThereIsNothingToLoad) {
  machine_.DiskFiles().Put("empty.xml", "");
  machine_.DiskFiles().Put("nul.xml", std::string("\0<a/>", 5));
  machine_.DiskFiles().Put("blank.xml", " \n");
  XmlObject object("<old/>");
  for (const char* path : {"none.xml", "empty.xml", "nul.xml"}) {
    EXPECT_FALSE(object.LoadFromFile(path, false, false, -1)) << path;
    EXPECT_EQ(object.ToString(true), "<old/>");
  }
  EXPECT_TRUE(object.LoadFromFile("blank.xml", false, false, -1));
  EXPECT_EQ(object.ToString(true), "");
}

TEST_F(XmlFiles, CountsThePlaceOfAnErrorFromItsOwnTopLevelElement) {
  const auto error = [&](const char* text, int index) {
    machine_.DiskFiles().Put("m.xml", text);
    try {
      static_cast<void>(XmlObject().LoadFromFile("m.xml", false, false, index));
    } catch (const std::runtime_error& thrown) {
      return std::string(thrown.what());
    }
    return std::string();
  };
  EXPECT_THAT(error("<a>\n\n</a><b>\n<1/></b>", 1), HasSubstr("(line 2, position 3) Invalid tag name"));
  // Of an element that is passed over nothing is kept but its name.
  EXPECT_THAT(error("<a/><b>\n<c/>text", 2), HasSubstr("(line 2, position 8) Missing end tag: b<b/>\n"));
}

TEST_F(XmlFiles, ReadsBackThePlainAndTheScrambledForm) {
  XmlObject tree("<r name='caf\xC3\xA9'/>");
  for (const bool scrambled : {false, true}) {
    XmlObject loaded;
    EXPECT_TRUE(tree.SaveToFile("s.xml", scrambled, false));
    EXPECT_EQ(loaded.LoadFromFile("s.xml", scrambled, false, -1), true);
    EXPECT_EQ(loaded.ToString(false), tree.ToString(false));
  }
  EXPECT_THAT(*machine_.TheMachine().files.Read("s.xml"), testing::Not(HasSubstr("name")));
}

TEST_F(XmlFiles, SaysWhetherTheFileWasWritten) {
  const XmlObject tree("<r/>");
  machine_.DiskFiles().Put("s.xml", "old");
  machine_.DiskFiles().FillDisk();
  EXPECT_FALSE(tree.TrySaveToFile("s.xml", false, false));
  EXPECT_TRUE(tree.SaveToFile("s.xml", false, false));
  EXPECT_EQ(machine_.TheMachine().files.Read("s.xml"), "old");
}

TEST_F(XmlFiles, FetchesOneValueOfAFile) {
  machine_.DiskFiles().Put("v.xml", "<r><o/><O><i>1</i></O><o><I>2</I><i>3</i></o></r>");
  EXPECT_EQ(XmlObject::GetValueFromFile("v.xml", "o", "I"), "1");
  EXPECT_EQ(XmlObject::GetValueFromFile("v.xml", "o", "x"), "");
  EXPECT_EQ(XmlObject::GetValueFromFile("none.xml", "o", "i"), "");
}

}  // namespace
}  // namespace panelglow
