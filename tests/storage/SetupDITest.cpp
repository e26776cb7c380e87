// Nodes of the device tree, lists of devices and interfaces, and the inventory of PCI functions, on trees of any
// shape.
#include "hw/SetupDI.h"

#include <gmock/gmock.h>

#include <array>

#include "hw/PciDeviceList.h"
#include "storage/StandIn.h"

namespace panelglow::storagetest {
namespace {

using namespace std::string_literals;
using testing::ElementsAre;

class SetupDITest : public testing::Test {
 protected:
  SetupDITest() { machine_.Use({.tree = &tree_}); }

  // A device "PCI\<n>" with this text as its hardware ids.
  Tree::Device Function(const std::string& hardwareIds) {
    Tree::Device device{.id = "PCI\\" + std::to_string(tree_.devices.size())};
    device.properties[1] = TextProperty(hardwareIds);
    return device;
  }

  Machine machine_;
  Tree tree_;
};

TEST_F(SetupDITest, WalksTheChildrenOfANode) {
  const auto parent = tree_.Add(0, {.id = "P"});
  for (const char* id : {"A", "B", "C"}) {
    tree_.Add(parent, {.id = id});
  }
  SetupDI child;
  EXPECT_FALSE(SetupDI().NextChild(child));
  EXPECT_FALSE(SetupDI(nullptr).NextChild(child));
  EXPECT_FALSE(SetupDI("not in the tree").NextChild(child));
  SetupDI node("P");
  std::string ids;
  while (node.NextChild(child)) {
    ids += child.GetDeviceInstanceId();
    EXPECT_FALSE(child.NextChild(child));  // a node without children
    EXPECT_EQ(child.GetDevNode(), tree_.Locate(ids.substr(ids.size() - 1)));
  }
  EXPECT_EQ(ids, "ABC");
  tree_.Add(parent, {.id = "D"});  // the last child stands, and its sibling is asked for again
  EXPECT_TRUE(node.NextChild(child));
  EXPECT_EQ(child.GetDeviceInstanceId(), "D");
  node.SetDevice("P");  // begins anew
  EXPECT_TRUE(node.NextChild(child));
  EXPECT_EQ(child.GetDeviceInstanceId(), "A");
  EXPECT_TRUE(child.GetParent(child));
  EXPECT_EQ(child.GetDevNode(), parent);
  EXPECT_FALSE(child.GetParent(child));
  EXPECT_EQ(child.GetDevNode(), parent);
  EXPECT_FALSE(SetupDI().GetParent(child));
}

TEST_F(SetupDITest, ReadsPropertiesIntoTheRoomThatThereIs) {
  auto device = Function("ids");
  device.properties[17] = {4, {1, 2, 3, 4}};
  tree_.Add(0, device);
  SetupDI list("PCI\\0");
  std::array<std::uint8_t, 4> room{};
  std::uint32_t type = 0;
  std::uint32_t size = 0;
  EXPECT_FALSE(list.ReadDeviceProperty(1, room, size, type));  // no list
  ASSERT_TRUE(list.OpenDeviceList("PCI", 6, "") && list.NextDevice());
  EXPECT_EQ(list.ReadNodeProperty(17, std::span(room).first(3), type), 0U);
  EXPECT_EQ(list.ReadNodeProperty(16, room, type), 0U);
  EXPECT_EQ(list.ReadNodeProperty(17, room, type), 4U);
  EXPECT_THAT(room, ElementsAre(1, 2, 3, 4));
  EXPECT_EQ(type, 4U);
  EXPECT_FALSE(list.ReadDeviceProperty(0, room, size, type));
  EXPECT_FALSE(list.ReadDeviceProperty(1, std::span(room).first(2), size, type));
  EXPECT_EQ(size, 3U);  // what it takes
  EXPECT_TRUE(list.ReadDeviceProperty(1, room, size, type));
  EXPECT_EQ(std::string(room.begin(), room.begin() + size), "ids");
  EXPECT_EQ(type, 7U);
}

TEST_F(SetupDITest, FindsAPciDeviceByItsFourIdsWithTheSubsystemsDeviceFirst) {
  tree_.Add(0, Function("PCI\\VEN_10DE&DEV_00AB&SUBSYS_56781234&REV_A1"));
  auto wanted = Function("PCI\\VEN_10DE&DEV_00AB&SUBSYS_12345678&REV_A1");
  wanted.properties[0] = TextProperty("A card\0rest"s);
  tree_.Add(0, wanted);
  SetupDI object;
  std::string description = "as it was";
  EXPECT_FALSE(object.FindPciDevice(0x10DE, 0xAB, 0x5678, 0x1235, description));
  EXPECT_EQ(description, "as it was");
  tree_.calls.clear();
  EXPECT_TRUE(object.FindPciDevice(0x10DE, 0xAB, 0x5678, 0x1234, description));
  EXPECT_EQ(description, "A card");
  EXPECT_THAT(tree_.calls, ElementsAre("open PCI 6 ", "property 1", "property 1", "property 0"));
}

// ---- the inventory

TEST_F(SetupDITest, TheInventoryReadsTheNumbersOfHardwareIds) {
  struct Case {
    std::string ids;
    std::array<unsigned, 5> numbers;  // vendor, device, subsystem vendor, subsystem device, revision
    unsigned classCode;
  };
  const Case kCases[] = {
      {"PCI\\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\0PCI\\VEN_8086&DEV_2922&CC_010601\0X&CC_0106\0"s,
       {0x8086, 0x2922, 0x5678, 0x1234, 2},
       0x010601},
      {"PCI\\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02&CC_0106", {0x8086, 0x2922, 0x5678, 0x1234, 2}, 0x0106},
      {"PCI\\VEN_86&DEV_29&SUBSYS_1&REV_2", {0x86, 0x29, 1, 0, 2}, 0xFFFFFF},  // shorter numbers
      {"pci\\ven_80ff&dev_29aa&subsys_abcdef01&rev_f0", {0x80FF, 0x29AA, 0xEF01, 0xABCD, 0xF0}, 0xFFFFFF},
      {"PCI\\VEN_GGGG&DEV_2922", {0, 0, 0, 0, 0}, 0xFFFFFF},  // nothing is read behind what is no number
      {"PCI\\VEN_8086", {0x8086, 0, 0, 0, 0}, 0xFFFFFF},
      {"CC_", {0, 0, 0, 0, 0}, 0xFFFFFF},
      {"CC_zz&CC_010601", {0, 0, 0, 0, 0}, 0xFFFFFF},  // the first mark counts
      {"\0\xFF\x01\x80"s, {0, 0, 0, 0, 0}, 0xFFFFFF},
      {"", {0, 0, 0, 0, 0}, 0xFFFFFF},
      {std::string(1024, '\xFF'), {0, 0, 0, 0, 0}, 0xFFFFFF},
  };
  for (const Case& c : kCases) {
    tree_.Add(0, Function(c.ids));
  }
  const PciDeviceList list;
  ASSERT_EQ(list.Devices().size(), std::size(kCases));
  for (std::size_t i = 0; i < std::size(kCases); ++i) {
    const PciDevice& device = list.Devices()[i];
    SCOPED_TRACE(kCases[i].ids);
    EXPECT_EQ((std::array<unsigned, 5>{device.vendorId, device.deviceId, device.subVendorId, device.subDeviceId,
                                       device.revision}),
              kCases[i].numbers);
    EXPECT_EQ(device.classCode, kCases[i].classCode);
  }
}

int PlaceOf(const PciDevice& device) { return device.bus * 10000 + device.device * 100 + device.function; }

TEST_F(SetupDITest, TheInventoryCountsEqualFunctionsAndReadsTheRest) {
  auto first = Function("PCI\\VEN_0001&DEV_0002&SUBSYS_00040003&REV_00");
  first.properties = {{1, first.properties[1]},
                      {0, TextProperty("Card")},
                      {9, TextProperty("{class}\\0001")},
                      {13, TextProperty("PCI-Bus 3, Ger\xE4t 31, Funktion 7")},
                      {16, {4, {1, 0, 0, 0x80}}}};
  tree_.Add(0, first);
  tree_.Add(0, Function("PCI\\VEN_0001&DEV_0002&SUBSYS_99999999&REV_00"));
  tree_.Add(0, Function("PCI\\VEN_0001&DEV_0002&SUBSYS_00040003&REV_00"));
  const PciDeviceList list;
  const PciDevice& device = list.Devices()[0];
  EXPECT_EQ(PlaceOf(device), 33107);
  EXPECT_EQ(device.slot, 0x80000001U);
  EXPECT_EQ(device.driverKey + "|" + device.description + "|" + device.instanceId, "{class}\\0001|Card|PCI\\0");
  EXPECT_EQ(list.Devices()[1].earlierEqual + 10 * list.Devices()[2].earlierEqual, 21U);
  EXPECT_EQ(list.CountDevices(1, 2, 3, 4), 2);
  EXPECT_EQ(list.CountDevices(1, 2, 4, 3) + list.CountDevices(0x10001, 2, 3, 4), 0);
  PciDevice found;
  EXPECT_TRUE(list.FindDevice(1, 2, 3, 4, 2, found));
  EXPECT_EQ(found.instanceId, "PCI\\2");
  EXPECT_FALSE(list.FindDevice(1, 2, 3, 4, 3, found) || list.FindDevice(1, 2, 3, 4, 0, found));
}

TEST_F(SetupDITest, TheInventoryAsksTheDriverForAPlaceThatTheSystemDoesNotTell) {
  Machine machine("[[pci]]\nbus = 2\ndevice = 5\nfunction = 1\n[pci.registers]\n\"0\" = 0x00020001\n");
  machine.Use({.tree = &tree_});
  tree_.Add(0, Function("PCI\\VEN_0001&DEV_0002"));
  tree_.Add(0, Function("PCI\\VEN_0001&DEV_0002"));  // a second one that nobody has seen
  const PciDeviceList list;
  EXPECT_EQ(PlaceOf(list.Devices()[0]), 20501);
  EXPECT_EQ(PlaceOf(list.Devices()[1]), 0);
  // Nor for numbers that are no place.
  const std::pair<const char*, int> kTexts[] = {{"PCI bus 255, device 31, function 7", 2553107},
                                                {"PCI bus 256, device 31, function 7", 20501},
                                                {"PCI bus 255, device 32, function 7", 20501},
                                                {"PCI bus 255, device 31, function 8", 20501},
                                                {"PCI bus 255, device 31", 20501}};
  for (const auto& [text, place] : kTexts) {
    tree_.devices.clear();
    auto told = Function("PCI\\VEN_0001&DEV_0002");
    told.properties[13] = TextProperty(text);
    tree_.Add(0, told);
    EXPECT_EQ(PlaceOf(PciDeviceList().Devices()[0]), place) << text;
  }
}

TEST_F(SetupDITest, TheInventoryHasALimitAndCannotBeWithoutIds) {
  for (int i = 0; i < 130; ++i) {
    tree_.Add(0, Function("PCI\\VEN_0001&DEV_0002&SUBSYS_00040003&REV_00"));
  }
  EXPECT_EQ(PciDeviceList::Instance().Devices().size(), 128U);
  const auto thrown = [] {
    try {
      PciDeviceList::Forget();
      PciDeviceList::Instance();
    } catch (int code) {
      return code;
    }
    return 0;
  };
  tree_.devices[5].properties.clear();
  EXPECT_EQ(thrown(), 129);
  tree_.devices.clear();
  EXPECT_EQ(thrown(), 0);  // a machine without any is one
  tree_.refuses = true;
  EXPECT_EQ(thrown(), 129);
}

}  // namespace
}  // namespace panelglow::storagetest
