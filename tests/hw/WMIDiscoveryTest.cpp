#include "hw/WMIDiscovery.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::ManagementArray;
using platform::ManagementRow;
using platform::ManagementScalar;
using platform::sim::MachineDescription;
using platform::sim::Simulation;

MachineDescription Machine() {
  ManagementRow first;
  first.Set(u"Caption", {ManagementScalar(wstring(u"Disk \u20AC"))});
  first.Set(u"Nothing", {ManagementScalar()});
  first.Set(u"Names", {ManagementArray{ManagementScalar(wstring(u"n1")), ManagementScalar(wstring(u"n2"))}});
  first.Set(u"Size", {ManagementScalar(std::uint32_t{0xFFFFFFFF})});
  first.Set(u"Signed", {ManagementScalar(std::int8_t{-3})});
  first.Set(u"Wide", {ManagementScalar(wstring(u"1099511627776"))});
  first.Set(u"Numbers", {ManagementArray{ManagementScalar(std::int16_t{7}), ManagementScalar(std::int16_t{8})}});
  first.Set(u"Empty", {ManagementArray{}});
  first.Set(u"Bytes", {ManagementArray{ManagementScalar(std::uint8_t{1}), ManagementScalar(std::uint8_t{0xFF})}});
  ManagementRow second;
  second.Set(u"Caption", {ManagementScalar(wstring(u"second"))});
  second.Set(u"Bytes", {ManagementArray{ManagementScalar(std::uint8_t{9})}});
  MachineDescription machine;
  machine.management = {{"ROOT\\CIMV2", "Win32_Disk", {first, second}}, {"ROOT\\CIMV2", "Win32_Fan", {second}}};
  return machine;
}

class Management : public testing::Test {
 protected:
  Simulation machine_{Machine(), {}};
  WMIDiscovery discovery_{"ROOT\\CIMV2"};
};

TEST_F(Management, ReadsTextsOfTheCurrentTable) {
  const struct {
    const char16_t* property;
    int row;
    bool found;
    const char* text;
  } kCases[] = {
      {u"Caption", 0, true, "Disk \x80"}, {u"caption", 1, true, "second"}, {u"Names", 0, true, "n1"},
      {u"Nothing", 0, true, ""},          {u"Size", 0, true, ""},          {u"Empty", 0, true, ""},
      {u"Names", 1, false, ""},
  };
  std::string text = "as it was";
  EXPECT_FALSE(discovery_.GetCurrentValue(u"Caption", text, 0));
  ASSERT_EQ(discovery_.RunQuery(u"SELECT * FROM Win32_Disk"), 2);
  for (const auto& c : kCases) {
    EXPECT_EQ(discovery_.GetCurrentValue(c.property, text, c.row), c.found) << c.row;
    EXPECT_EQ(text, c.text);
  }
  EXPECT_FALSE(discovery_.GetCurrentValue(u"Caption", text, 2));
  EXPECT_FALSE(discovery_.GetCurrentValue(u"Caption", text, -1));
  EXPECT_EQ(discovery_.RunQuery(u"SELEKT"), 0);
  EXPECT_FALSE(discovery_.GetCurrentValue(u"Caption", text, 0));
  EXPECT_EQ(discovery_.RunQuery(u"SELECT * FROM Win32_Fan"), 1);
  EXPECT_TRUE(discovery_.GetCurrentValue(u"Caption", text, 0));
  EXPECT_EQ(text, "second");
}

TEST_F(Management, KeepsTablesByName) {
  std::string text;
  EXPECT_EQ(discovery_.RowCount(u"t"), -1);
  EXPECT_FALSE(discovery_.GetValue(u"t", u"Caption", text, 0));
  discovery_.RunNamedQuery(u"t", u"SELECT * FROM Win32_Disk");
  EXPECT_EQ(discovery_.RowCount(u"t"), 2);
  discovery_.RunNamedQuery(u"t", u"SELECT * FROM Win32_Fan");
  EXPECT_EQ(discovery_.RowCount(u"t"), 1);
  EXPECT_TRUE(discovery_.GetValue(u"t", u"Caption", text, 0));
  EXPECT_FALSE(discovery_.GetValue(u"t", u"Caption", text, 1));
  discovery_.RunNamedQuery(u"t", u"nonsense");
  EXPECT_EQ(discovery_.RowCount(u"t"), 0);
  discovery_.GetTable(u"Win32_Disk");
  EXPECT_EQ(discovery_.RowCount(u"Win32_Disk"), 2);
  discovery_.RunNamedQuery(u"Win32_Fan", u"SELECT * FROM Win32_Disk");
  discovery_.GetTable(u"Win32_Fan");  // a table of that name is there already
  EXPECT_EQ(discovery_.RowCount(u"Win32_Fan"), 2);
}

TEST_F(Management, ReadsNumbersByTheirType) {
  const struct {
    const char16_t* property;
    double number;
  } kCases[] = {
      {u"Size", 4294967295.0}, {u"Signed", -3}, {u"Wide", 1099511627776.0}, {u"Numbers", 7}, {u"Nothing", 0.5},
      {u"Empty", 0.5},         {u"None", 0.5},
  };
  for (const auto& c : kCases) {
    double number = 0.5;
    discovery_.QueryNumber(u"select x from Win32_Disk", c.property, number);
    EXPECT_EQ(number, c.number);
  }
  double number = 0.5;
  discovery_.QueryNumber(u"nonsense", u"Size", number);
  EXPECT_EQ(number, 0.5);
}

TEST_F(Management, ReadsTheBytesOfTheLastRow) {
  std::vector<std::uint8_t> bytes;
  EXPECT_EQ(discovery_.GetBinaryProperty(u"Win32_Disk", u"Bytes", bytes), 0);
  EXPECT_EQ(bytes, std::vector<std::uint8_t>{9});
  EXPECT_EQ(discovery_.GetBinaryProperty(u"Win32_Disk", u"Size", bytes), -1);  // which the second row lacks
  EXPECT_EQ(discovery_.GetBinaryProperty(u"None", u"Bytes", bytes), -1);
  EXPECT_EQ(discovery_.GetBinaryProperty(u"Win32_Fan", u"Caption", bytes), 0);  // no array
  EXPECT_EQ(bytes, std::vector<std::uint8_t>{9});
}

TEST_F(Management, ThrowsATextWhenItCannotConnect) {
  try {
    WMIDiscovery("ROOT\\None");
    FAIL() << "connected";
  } catch (const std::string& text) {
    EXPECT_EQ(text, "WMIDiscovery Error: Could not connect. Error code = 0x8004100e\n");
  }
}

}  // namespace
}  // namespace panelglow
