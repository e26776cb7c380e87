// What becomes of a million texts, as one number: whatever is changed for speed has to leave it as it is. A change
// that is meant gets a new number, after a look at what it was that changed: PANELGLOW_XML_OUTCOMES=FILE writes a
// line for each text, to be compared with what the code did before. PANELGLOW_XML_ROUNDS=50 takes all texts.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <utility>

#include "config/RandomXml.h"
#include "config/XmlObject.h"
#include "config/iptstream.h"
#include "config/optstream.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

constexpr int kAllRounds = 50;
constexpr int kTextsOfARound = 20'000;
constexpr std::uint64_t kOutcomeOfFirstRound = 11395347049698354765U;
constexpr std::uint64_t kOutcomeOfAllRounds = 14407911112556002917U;

// A number for all that was added, in its order.
class Digest {
 public:
  void Add(std::uint64_t word) {
    sum_ = (sum_ ^ word) * 0x9E3779B97F4A7C15U;
    sum_ ^= sum_ >> 32U;
  }
  void Add(std::string_view text) {
    Add(text.size());
    for (; !text.empty(); text.remove_prefix(std::min(text.size(), sizeof(std::uint64_t)))) {
      std::uint64_t word = 0;
      std::memcpy(&word, text.data(), std::min(text.size(), sizeof(word)));
      Add(word);
    }
  }
  void Add(const XmlObject& object) {
    Add(object.name);
    Add(object.value);
    Add(static_cast<std::uint64_t>(object.depth));
    AddAll(object.attributes);
    AddAll(object.GetProlog().declaration);
    for (const std::string& instruction : object.GetProlog().instructions) {
      Add(instruction);
    }
    Add(object.children.size());
    for (const XmlObject& child : object.children) {
      Add(static_cast<std::uint64_t>(child.parent == &object ? 1 : 0));
      Add(child);
    }
  }
  [[nodiscard]] std::uint64_t Sum() const { return sum_; }

 private:
  template <class Attributes>
  void AddAll(const Attributes& attributes) {
    Add(attributes.size());
    for (const XmlAttribute& attribute : attributes) {
      Add(attribute.name);
      Add(attribute.value);
    }
  }

  std::uint64_t sum_ = 0;
};

// One text on one of the ways into a tree, and the tree through some changes.
class Outcome {
 public:
  Outcome(platform::sim::Simulation& machine, RandomXml& random) : machine_(machine), random_(random) {}

  std::uint64_t Of(const std::string& text) {
    try {
      Follow(text);
    } catch (const std::runtime_error& failure) {
      digest_.Add(failure.what());
    }
    digest_.Add(tree_);  // also what a failure left
    digest_.Add(tree_.ToString(true));
    return digest_.Sum();
  }

 private:
  void Follow(const std::string& text) {
    const std::size_t way = random_.Below(10);
    if (way == 0) {
      XmlObject known("<e a='1' name='text'>x<property name='n' value='v'/><k>Value</k></e>");
      digest_.Add(static_cast<std::uint64_t>(known.Matches(text) ? 1 : 0));
    } else if (way < 4) {
      machine_.DiskFiles().Put("f.xml", text);
      const bool scrambled = random_.Below(8) == 0;
      const bool wrap = random_.Below(2) == 0;
      const int index = static_cast<int>(random_.Below(5)) - 1;
      digest_.Add(static_cast<std::uint64_t>(tree_.LoadFromFile("f.xml", scrambled, wrap, index) ? 1 : 0));
    } else {
      tree_ = XmlObject(text);
    }
    digest_.Add(tree_);
    for (std::size_t changes = random_.Below(3); changes > 0; --changes) {
      Change();
      digest_.Add(tree_);
    }
  }

  // An element on a random way down from `from`.
  XmlObject& AnyOf(XmlObject& from) {
    XmlObject* element = &from;
    while (!element->children.empty() && random_.Below(3) != 0) {
      element = element->GetObjectAt(static_cast<unsigned>(random_.Below(element->children.size())));
    }
    return *element;
  }

  void Change() {
    XmlObject& element = AnyOf(tree_);
    const std::string longText(random_.Below(40), 'l');
    switch (random_.Below(9)) {
      case 0:
        tree_.AddChild(XmlObject(element));  // sisters may move
        break;
      case 1:
        element.AddChild(XmlObject("<new a='1'><b>" + longText + "</b></new>"));
        break;
      case 2:
        element.RemoveChildren(std::string(AnyOf(element).name));
        break;
      case 3:
        element.SetAttribute("name", longText + "\x01");
        break;
      case 4:
        element.RemoveAttribute("NAME");
        break;
      case 5:
        tree_ = std::move(element);  // often out of its own subtree
        break;
      case 6:
        element.Clear();
        break;
      case 7:
        element.value = longText;
        break;
      default:
        Stream();
        break;
    }
  }

  // Through an object stream that may be damaged on its way, behind what the tree has.
  void Stream() {
    std::ostringstream written;
    optstream(written).WriteValue(tree_);
    std::string bytes = std::move(written).str();
    if (random_.Below(3) == 0) {
      random_.Damage(bytes, 2);
    }
    std::istringstream read(bytes);
    iptstream(read).ReadValue(tree_);
  }

  platform::sim::Simulation& machine_;
  RandomXml& random_;
  XmlObject tree_;
  Digest digest_;
};

TEST(XmlSweep, EveryTextBecomesWhatItAlwaysBecame) {
  const char* wanted = std::getenv("PANELGLOW_XML_ROUNDS");
  const char* file = std::getenv("PANELGLOW_XML_OUTCOMES");
  const int rounds = wanted == nullptr ? 1 : std::atoi(wanted);
  std::ofstream outcomes;
  if (file != nullptr) {
    outcomes.open(file, std::ios::binary);
  }
  platform::sim::Simulation machine{platform::sim::MachineDescription{}, {}};
  Digest all;
  for (int round = 0; round < rounds; ++round) {
    RandomXml random(static_cast<std::uint32_t>(round));
    for (int i = 0; i < kTextsOfARound; ++i) {
      const std::string text = random.Text();
      const std::uint64_t outcome = Outcome(machine, random).Of(text);
      outcomes << outcome << ' ' << text << '\n';
      all.Add(outcome);
    }
    if (round == 0) {
      EXPECT_EQ(all.Sum(), kOutcomeOfFirstRound);
    }
  }
  if (rounds == kAllRounds) {
    EXPECT_EQ(all.Sum(), kOutcomeOfAllRounds);
  }
}

}  // namespace
}  // namespace panelglow
