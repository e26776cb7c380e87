// Where a large text's tree has its memory. Whether all of it comes back, and nothing too early, the sanitizers say.
#include "config/XmlBlocks.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "config/XmlList.h"
#include "config/XmlObject.h"

namespace panelglow {
namespace {

constexpr int kGroups = 3000;  // a dozen blocks

std::string LargeText() {
  std::string text = "<log>";
  for (int i = 0; i < kGroups; ++i) {
    text += "<group number='" + std::to_string(i) + "' text='more than fifteen characters &amp; all'>";
    text += "<item>a value of more than fifteen characters</item><item/><item/></group>";
  }
  return text + "</log>";
}

std::string GroupText(int number) {
  return "<group number=\"" + std::to_string(number) + "\" text=\"more than fifteen characters &amp; all\">" +
         "<item>a value of more than fifteen characters</item><item/><item/></group>";
}

TEST(XmlBlocks, APartOutlivesTheTreeThatItWasLoadedWith) {
  XmlObject moved;
  XmlObject copied;
  XmlText text;
  XmlObject other("<other/>");
  {
    XmlObject tree(LargeText());
    moved = std::move(*tree.GetObjectAt(1));
    copied = *tree.GetObjectAt(2);
    text = std::move(tree.GetObjectAt(3)->attributes.back().value);
    other.AddChild(std::move(*tree.GetObjectAt(4)));
  }
  EXPECT_EQ(moved.ToString(true), GroupText(1));
  EXPECT_EQ(copied.ToString(true), GroupText(2));
  EXPECT_EQ(text, "more than fifteen characters & all");
  other.GetObjectAt(0)->AddChild(XmlObject("<new/>"));  // grows out of its block
  other.GetObjectAt(0)->SetAttribute("text", "another one of more than fifteen characters");
  other.GetObjectAt(0)->SetAttribute("third", "3");
  EXPECT_EQ(other.GetObjectAt(0)->GetNumberOfObjects(), 4U);
  EXPECT_EQ(other.GetObjectAt(0)->GetAttributeValue("number", ""), "4");
}

TEST(XmlBlocks, ATreeThatBreaksOffLeavesNothing) {
  std::string text = LargeText();
  text.insert(text.rfind("</log>"), "<1/>");
  EXPECT_THROW(XmlObject{text}, std::runtime_error);
}

TEST(XmlBlocksThreads, PartsOfOneTreeEndOnThreadsOfTheirOwn) {
  constexpr unsigned kThreads = 4;
  XmlObject tree(LargeText());
  std::vector<XmlObject> parts(kThreads);
  for (unsigned i = 0; i < unsigned{kGroups}; ++i) {  // neighbours, which share a block, go to different threads
    parts[i % kThreads].AddChild(std::move(*tree.GetObjectAt(i)));
  }
  tree.Clear();
  std::vector<std::thread> threads;
  for (XmlObject& part : parts) {
    threads.emplace_back([taken = std::move(part)]() mutable {
      EXPECT_EQ(taken.GetNumberOfObjects(), kGroups / kThreads);
      taken.Clear();
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
}

TEST(XmlList, GrowsByACopyOfOneOfItsOwnItems) {
  XmlList<XmlAttribute> list;
  list.emplace_back("name", "a value of more than fifteen characters");
  for (int i = 0; i < 20; ++i) {
    list.emplace_back(list.front());
  }
  EXPECT_EQ(list.back().value, "a value of more than fifteen characters");
  erase_if(list, [](const XmlAttribute& attribute) { return attribute.name == "name"; });
  EXPECT_TRUE(list.empty());
}

TEST(XmlList, AnItemThatCouldNotBeMadeIsNotThere) {
  struct Item {
    explicit Item(int number) : text(std::to_string(number)) {
      if (number < 0) {
        throw std::length_error("no room");
      }
    }
    std::string text;
  };
  XmlList<Item> list;
  list.reserve(2);
  list.emplace_back(1);
  for (int i = 0; i < 2; ++i) {  // with room for it, and without
    EXPECT_THROW(list.emplace_back(-1), std::length_error);
    EXPECT_EQ(list.size(), 1U + static_cast<std::size_t>(i));
    EXPECT_EQ(list.emplace_back(2).text, "2");
  }
}

TEST(XmlBlocks, PiecesStandSideBySideAndKeepWhatIsInThem) {
  XmlBlocks blocks;
  std::vector<std::pair<unsigned char*, std::size_t>> pieces;
  for (std::size_t i = 0; i < 1000; ++i) {
    const std::size_t size = i % 100 == 99 ? XmlBlocks::kLargestPiece : 1 + i % 50;
    auto* const piece = static_cast<unsigned char*>(blocks.Take(size));
    ASSERT_EQ(reinterpret_cast<std::uintptr_t>(piece) % alignof(void*), 0U);
    std::memset(piece, static_cast<int>(i % 251), size);
    pieces.emplace_back(piece, size);
  }
  for (std::size_t i = 0; i < pieces.size(); ++i) {
    const auto& [piece, size] = pieces[i];
    ASSERT_TRUE(std::all_of(piece, piece + size, [i](unsigned char byte) { return byte == i % 251; })) << i;
    XmlBlocks::GiveBack(piece);
  }
}

}  // namespace
}  // namespace panelglow
