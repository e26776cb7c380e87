// The two readers of the firmware's structure table, and the system id that comes out of it.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <random>
#include <string>
#include <vector>

#include "hw/SMBIOSDiscovery.h"
#include "hw/SmbiosScanner.h"
#include "hw/Tsk.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::sim::MachineDescription;
using platform::sim::Simulation;
using Bytes = std::vector<std::uint8_t>;

// A structure: the bytes behind the header, which `formatted` gives from offset 4, and its strings.
Bytes Structure(std::uint8_t type, const Bytes& formatted, const std::vector<std::string>& strings) {
  Bytes bytes{type, static_cast<std::uint8_t>(formatted.size() + 4), 0x34, 0x12};
  bytes.insert(bytes.end(), formatted.begin(), formatted.end());
  for (const std::string& text : strings) {
    bytes.insert(bytes.end(), text.begin(), text.end());
    bytes.push_back(0);
  }
  bytes.insert(bytes.end(), strings.empty() ? 2 : 1, 0);
  return bytes;
}

Bytes BaseBoard(const std::vector<std::string>& strings, std::uint8_t product = 2) {
  return Structure(2, {1, product, 0, 3}, strings);
}

Bytes Joined(const std::vector<Bytes>& structures) {
  Bytes table;
  for (const Bytes& structure : structures) {
    table.insert(table.end(), structure.begin(), structure.end());
  }
  return table;
}

class Firmware : public testing::Test {
 protected:
  Simulation machine_{MachineDescription{}, {}};
};

// ---- SMBIOSDiscovery

TEST_F(Firmware, TakesFourCharactersOfTheBoardsProduct) {
  const std::vector<std::string> strings{"Maker", "2A78 Bd.", "SN1"};
  const Bytes many = Structure(11, {0}, std::vector<std::string>(300, "x"));
  const struct {
    const char* name;
    Bytes table;
    const char *product, *serial;
  } kCases[] = {
      {"eight characters", BaseBoard(strings), "2A78", "SN1"},
      {"two characters", BaseBoard({"M", "2A", "S"}), "2A", "S"},
      {"no product", BaseBoard(strings, 0), "", "SN1"},
      {"a number without a string", BaseBoard(strings, 9), "", "SN1"},
      {"blanks", BaseBoard({"M", "   ", "S"}), "", "S"},
      {"the last board wins", Joined({BaseBoard(strings), BaseBoard({"M", "3C01", "T"})}), "3C01", "T"},
      {"behind structures without strings", Joined({Structure(9, {1, 2}, {}), BaseBoard(strings)}), "2A78", "SN1"},
      {"behind a single closing NUL", Joined({{9, 4, 0, 0, 0}, BaseBoard(strings)}), "2A78", "SN1"},
      {"behind more strings than a field can name", Joined({many, BaseBoard(strings)}), "2A78", "SN1"},
      {"a short board", Structure(2, {1}, strings), "", ""},
      {"an empty table", {}, "", ""},
  };
  for (const auto& c : kCases) {
    const SMBIOSDiscovery found(c.table);
    EXPECT_EQ(found.GetProductText(), c.product) << c.name;
    EXPECT_EQ(found.boardSerial, c.serial) << c.name;
  }
}

TEST_F(Firmware, ReadsTheOtherStructures) {
  Bytes processor{1, 3, 0xCD, 1, 0xA9, 0, 0, 0, 0, 0, 0, 0, 2, 0, 100, 0, 0x10, 0x0E, 0x08, 0x07, 0x41};
  processor.resize(32);
  processor[31] = 4;  // cores
  const Bytes uuid{1, 2, 3, 4, 0x33, 0x22, 0x11, 0, 0x55, 0x44, 0x77, 0x66, 8, 9, 10, 11, 12, 13, 14, 15, 6, 5, 6};
  const SMBIOSDiscovery found(Joined({
      Structure(0, {1, 2, 0, 0, 3, 0, 0x78, 0x56, 0x34, 0x12}, {"Vendor", "1.2", "03/01/2024"}),
      Structure(1, uuid, {"Maker", "Product", "V", "SN", "SKU", "Family"}),
      Structure(3, {1, 0x83}, {"Maker"}),
      Structure(4, processor, {"Intel", "CPU @ 3.6"}),
      Structure(7, {1, 0x81, 0x01, 0, 0, 0x40, 0x80}, {"L2-Cache"}),
      Structure(16, {3, 3, 6, 0, 0, 0, 2, 0, 0, 0, 0}, {}),
      Structure(16, {3, 3, 9, 0, 0, 0, 0x80, 0, 0, 0, 0}, {}),
      Structure(208, {0x5A}, {}),
  }));
  EXPECT_EQ(found.biosInfo.vendor + found.biosInfo.version + found.biosInfo.releaseDate, "Vendor1.203/01/2024");
  EXPECT_EQ(found.biosInfo.characteristics, 0x12345678U);
  EXPECT_EQ(found.systemInfo.uuid, "00112233-4455-6677-0809-0A0B0C0D0E0F");
  EXPECT_EQ(found.systemInfo.manufacturer + found.systemInfo.productName + found.systemInfo.version +
                found.systemInfo.serialNumber + found.systemInfo.sku + found.systemInfo.family,
            "MakerProductVSNSKUFamily");
  EXPECT_EQ(found.chassisType, 3);
  ASSERT_EQ(found.processors.size(), 1U);
  const ProcessorInfo info = found.GetProcessor(0);
  EXPECT_EQ(info.family, 0xCDU);
  EXPECT_EQ(info.manufacturer, "Intel");
  EXPECT_EQ(info.version, "CPU @ 3.6");
  EXPECT_EQ(info.processorId, "000000A9");
  EXPECT_EQ(info.maximumSpeed, 3600);
  EXPECT_EQ(info.coreCount, 4);
  EXPECT_EQ(info.model, 10U * 3 + 10);  // of the processor that runs this: extended model 3, model 10
  EXPECT_EQ(info.longMode, "yes");
  EXPECT_EQ(found.populatedSockets, 1U);
  EXPECT_FALSE(found.isAmd);
  EXPECT_EQ(found.caches.at(0).level + found.caches.at(0).size + found.caches.at(0).socket, "L24096L2-Cache");
  EXPECT_EQ(found.memoryArrays.at(0).errorCorrection, "Multi-bit ECC");
  EXPECT_EQ(found.memoryArrays.at(0).maximumCapacity, "32 GB");
  EXPECT_EQ(found.memoryArrays.at(1).errorCorrection, "Unknown");
  EXPECT_EQ(found.memoryArrays.at(1).maximumCapacity, "Unknown");
  EXPECT_EQ(found.oemByte, 0x5A);
  EXPECT_EQ(SMBIOSDiscovery(Bytes{}).oemByte, ' ');
}

Bytes MemoryDevice(std::uint16_t size, std::uint8_t type) {
  Bytes fields(30, 0);
  fields[8] = static_cast<std::uint8_t>(size);
  fields[9] = static_cast<std::uint8_t>(size >> 8U);
  fields[14] = type;
  fields[25] = 0x80;  // extended size: 32768 MB
  return Structure(17, fields, {});
}

TEST_F(Firmware, DescribesMemoryDevicesAndLeavesFlashOut) {
  const SMBIOSDiscovery found(
      Joined({MemoryDevice(8, 9), MemoryDevice(4096, 24), MemoryDevice(0, 2), MemoryDevice(0xFFFF, 1),
              MemoryDevice(8, 9), MemoryDevice(0x7FFF, 25), MemoryDevice(0x8800, 26), MemoryDevice(8, 9)}));
  std::string texts;
  for (const MemoryDeviceInfo& info : found.memoryDevices) {
    texts += info.size + " " + info.installed + " " + info.type + "; ";
  }
  EXPECT_EQ(texts,
            "4096 Installed DDR3; 0 Not Installed Unknown; Unknown Installed Other; 32768 Installed FBD2; "
            "2 Installed Unknown; ");
}

TEST_F(Firmware, NamesAMemoryDeviceByItsTexts) {
  Bytes fields(30, 0);
  fields[8] = 0x10;
  for (const std::size_t at :
       {12, 13, 19, 20, 21, 22}) {  // two locators, maker, serial number, asset tag, part number
    fields[at] = static_cast<std::uint8_t>(
        1 + std::count_if(fields.begin() + 12, fields.end(), [](std::uint8_t text) { return text != 0; }));
  }
  const SMBIOSDiscovery found(Structure(17, fields, {"DIMM0", "Bank0", "Maker", "SN", "Tag", "PN"}));
  const MemoryDeviceInfo& info = found.memoryDevices.at(0);
  EXPECT_EQ(info.deviceLocator + " " + info.bankLocator + " " + info.manufacturer + " " + info.serial + " " +
                info.assetTag + " " + info.partNumber,
            "DIMM0 Bank0 Maker SN Tag PN");
}

TEST_F(Firmware, LeavesRecordsPastItsLimitsUnstored) {
  Bytes processor(32, 0);
  processor[20] = 0x41;
  Bytes table;
  for (int i = 0; i < 120; ++i) {
    const Bytes both = Joined({Structure(4, processor, {}), MemoryDevice(1024, 24)});
    table.insert(table.end(), both.begin(), both.end());
  }
  const SMBIOSDiscovery found(table);
  EXPECT_EQ(found.processors.size(), SMBIOSDiscovery::kMostProcessors);
  EXPECT_EQ(found.memoryDevices.size(), SMBIOSDiscovery::kMostMemoryDevices);
  EXPECT_EQ(found.populatedSockets, 120U);
  EXPECT_EQ(found.GetProcessor(10).manufacturer, "");
}

TEST(FirmwareOfAnotherProcessor, IsNoticed) {
  MachineDescription description;
  description.firmware.processors = {{"AMD", 0x6B}};
  description.is64Bit = false;
  Simulation machine(description, {});
  const SMBIOSDiscovery found(Structure(4, Bytes(32, 0), {}));
  EXPECT_TRUE(found.isAmd);
  EXPECT_EQ(found.GetProcessor(0).longMode, "no");
}

// ---- SmbiosScanner

// Firmware memory from 0xF0000: an entry point at `anchor` and the table behind it.
class Memory {
 public:
  Memory(const Bytes& table, std::uint16_t count, std::uint16_t version = 0x0402, std::uint32_t anchor = 0x100) {
    constexpr std::uint32_t kTable = 0x1003;  // on no paragraph
    Put(anchor, {'_', 'S', 'M', '_', 0, 0x1F});
    PutWord(anchor + 6, version);
    PutWord(anchor + 22, static_cast<std::uint16_t>(table.size()));
    PutWord(anchor + 24, kTable);
    PutWord(anchor + 26, 0x000F);
    PutWord(anchor + 28, count);
    Put(kTable, table);
  }

  [[nodiscard]] SmbiosScanner Scanned() const {
    SmbiosScanner scanner;
    const auto byte = [&](std::uint16_t segment, std::uint16_t offset) {
      const std::uint32_t address = (std::uint32_t{segment} << 4U) + offset;
      return address >= 0xF0000 && address < 0x100000 ? bytes_[address - 0xF0000] : std::uint8_t{0};
    };
    scanner.Scan({byte, [&](std::uint16_t segment, std::uint16_t offset) {
                    return static_cast<std::uint16_t>(byte(segment, offset) |
                                                      byte(segment, static_cast<std::uint16_t>(offset + 1)) << 8U);
                  }});
    return scanner;
  }

  [[nodiscard]] std::string Product() const {
    const SmbiosScanner scanner = Scanned();
    const std::span<const std::uint8_t> board = scanner.At(scanner.Find(2));
    return board.size() < 6 ? "none" : SmbiosScanner::StringOf(board, board[5]);
  }

 private:
  void Put(std::uint32_t at, const Bytes& bytes) { std::copy(bytes.begin(), bytes.end(), bytes_.begin() + at); }
  void PutWord(std::uint32_t at, std::uint16_t word) {
    Put(at, {static_cast<std::uint8_t>(word), static_cast<std::uint8_t>(word >> 8U)});
  }

  Bytes bytes_ = Bytes(0x10000, 0);
};

TEST(SmbiosScanner, WalksTheTableBehindTheEntryPoint) {
  const Bytes board = BaseBoard({"M", "2A78 Board", "S"});
  // A memory controller's length is by its slots, whatever its header says; two zero bytes behind it are its own.
  const auto controller = [](std::uint8_t slots, std::size_t zeroes) {
    Bytes bytes(16 + std::size_t{2} * slots + zeroes, 0x11);
    bytes[0] = 5;
    bytes[1] = 8;
    bytes[14] = slots;
    std::fill(bytes.end() - static_cast<std::ptrdiff_t>(zeroes), bytes.end(), std::uint8_t{0});
    return bytes;
  };
  EXPECT_EQ(Memory(board, 1).Product(), "2A78 Board");
  EXPECT_EQ(Memory(board, 1, 0x0402, 0xFFE0).Product(), "2A78 Board");
  for (const std::uint8_t slots : std::initializer_list<std::uint8_t>{0, 2, 200}) {
    EXPECT_EQ(Memory(Joined({controller(slots, 0), board}), 2).Product(), "2A78 Board") << unsigned{slots};
    EXPECT_EQ(Memory(Joined({controller(slots, 2), board}), 2).Product(), "2A78 Board") << unsigned{slots};
  }
  EXPECT_EQ(Memory(Joined({controller(2, 3), board}), 2).Product(), "none");  // one zero too many
  EXPECT_EQ(Memory(Joined({Structure(1, {1}, {"x", "y"}), board}), 2).Product(), "2A78 Board");
  EXPECT_EQ(Memory(Joined({Structure(1, {1}, {}), board}), 1).Product(), "none");  // not among those counted
  EXPECT_EQ(Memory(Joined({Structure(1, {1}, {}), board}), 0x0102, 0x0102).Product(), "2A78 Board");
  EXPECT_EQ(Memory(Joined({Structure(1, {1}, {}), board}), 0x0101, 0x0102).Product(), "none");  // a count of one byte
  EXPECT_EQ(Memory(Bytes{}, 1).Product(), "none");
  EXPECT_EQ(Memory(Joined({BaseBoard({"M", "P"}, 4), Structure(1, {1}, {"x"})}), 2).Product(), "");  // no such string
  EXPECT_EQ(Memory(Bytes{2, 8, 0, 0, 1, 1, 0, 3, 'P'}, 1).Product(), "P");                           // never closed
  EXPECT_EQ(Memory(Joined({board, BaseBoard({"M", "other", "S"})}), 2).Product(), "2A78 Board");
}

TEST(SmbiosScanner, FindsNothingWithoutAnEntryPoint) {
  SmbiosScanner scanner;
  int reads = 0;
  scanner.Scan({[&](std::uint16_t, std::uint16_t) { return ++reads, std::uint8_t{0}; }, nullptr});
  EXPECT_EQ(scanner.Find(2), -1);
  EXPECT_TRUE(scanner.At(-1).empty());
  EXPECT_EQ(reads, 0x1000);  // the first byte of each paragraph rules it out
}

// ---- both

TEST_F(Firmware, StaysInsideATableThatLies) {
  const Bytes sound = Joined({Structure(0, Bytes(20, 1), {"a"}), Structure(1, Bytes(23, 1), {"b", "c"}),
                              BaseBoard({"M", "2A78", "S"}), Structure(4, Bytes(32, 2), {"d"}),
                              Structure(5, Bytes(12, 3), {}), MemoryDevice(64, 24), Structure(127, {}, {})});
  std::mt19937 random(11);
  for (int i = 0; i < 3000; ++i) {
    Bytes table(sound.begin(), sound.begin() + static_cast<std::ptrdiff_t>(random() % (sound.size() + 1)));
    for (std::size_t k = random() % 6; k > 0 && !table.empty(); --k) {
      table[random() % table.size()] = static_cast<std::uint8_t>(random());
    }
    EXPECT_LE(SMBIOSDiscovery(table).GetProductText().size(), 4U);
    const SmbiosScanner scanner = Memory(table, static_cast<std::uint16_t>(random() % 300)).Scanned();
    for (const int type : {0, 2, 5, 127, 255}) {
      const auto structure = scanner.At(scanner.Find(static_cast<std::uint8_t>(type)));
      EXPECT_LE(SmbiosScanner::StringOf(structure, static_cast<std::uint8_t>(random())).size(), table.size());
    }
  }
}

// ---- the system id

TEST(SystemId, IsTheLeadingHexadecimalNumberOfTheProductText) {
  const std::pair<const char*, std::uint16_t> kCases[] = {
      {"2A78", 0x2A78}, {"Desk", 0xDE},    {"2a", 0x2A},           {"", 0}, {"Zed", 0}, {"0x1F", 0x1F},
      {" 7", 7},        {"12345", 0x2345}, {"2A78FFFFFF", 0xFFFF},
  };
  for (const auto& [text, id] : kCases) {
    EXPECT_EQ(SystemIdOf(text), id) << text;
  }
}

// The tables are read once per process: each machine is met by a process of its own.
TEST(SystemIdDeathTest, ComesFromTheManagementServiceOrFromTheFirmwareItself) {
  const struct {
    const char* product;
    bool inManagement, driver;
    std::uint16_t id;
  } kCases[] = {
      {"2A78 Board", true, false, 0x2A78},
      {"2A78 Board", false, true, 0x2A78},
      {"2A78 Board", false, false, 0},
      {"Zed", true, true, 0},
      {"", true, true, 0},
  };
  for (const auto& c : kCases) {
    EXPECT_EXIT(
        {
          MachineDescription description;
          description.firmware.boardProduct = c.product;
          description.firmware.inManagement = c.inManagement;
          description.driver.present = c.driver;
          Simulation machine(description, {});
          std::uint16_t id = 0xFFFF;
          const bool found = Tsk_GetSystemID(id);
          std::_Exit(found == (c.id != 0) && id == c.id ? 0 : 1);
        },
        testing::ExitedWithCode(0), "")
        << c.product << c.inManagement << c.driver;
  }
}

}  // namespace
}  // namespace panelglow
