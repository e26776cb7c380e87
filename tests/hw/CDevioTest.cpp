#include "hw/CDevio.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <functional>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "hw/PciDeviceList.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using ::testing::ElementsAre;

using platform::sim::DriverDescription;
using platform::sim::DriverRequest;
using platform::sim::MachineDescription;
using platform::sim::Simulation;

std::string Hex(const std::vector<std::byte>& bytes) {
  std::string text;
  for (const std::byte byte : bytes) {
    char digits[4];
    std::snprintf(digits, sizeof digits, "%02X", std::to_integer<unsigned>(byte));
    text += digits;
  }
  return text;
}

constexpr std::uint16_t kBridge = 0x00F8;   // bus 0, device 31, function 0
constexpr std::uint16_t kSerial = 0x00FA;   // ... function 2
constexpr std::uint16_t kNetwork = 0x0200;  // bus 2, device 0

MachineDescription Machine(bool is64Bit) {
  MachineDescription machine;
  machine.is64Bit = is64Bit;
  machine.pci = {{kBridge, {{0x00, 0x1C4F8086}, {0x08, 0x06010005}, {0x2C, 0x00000000}}},
                 {kSerial, {{0x00, 0x1C028086}, {0x08, 0x06010004}, {0x2C, 0x3048103C}}},
                 {kNetwork, {{0x00, 0x816810EC}, {0x08, 0x02000006}, {0x2C, 0x3048103C}}}};
  machine.pci[0].description = "A Link";
  machine.pci[1].description = "A Link #2";
  machine.pci[2].description = "A Link #3";
  return machine;
}

class CDevioTest : public testing::Test {
 protected:
  Simulation machine_{Machine(true), {}};
  CDevio devio_;
  std::uint16_t location_ = 0;
};

// ---- the records

TEST(CDevio, SendsEachRequestByteByByte) {
  std::uint8_t byte = 0;
  std::uint16_t word = 0;
  std::uint32_t dword = 0;
  std::uint64_t msr = 0xAABBCCDD00000199;
  std::vector<std::byte> buffer(7);
  using Device = CDevio&;
  const struct {
    std::uint32_t code;
    bool is64Bit;
    std::size_t size;
    std::size_t answerSize;
    const char* record;  // without the zeroes at its end
    std::function<void(CDevio&)> send;
  } kCases[] = {
      {0x220004, true, 12, 4, "3412000001", [&](Device d) { d.InportByte(0x1234); }},
      {0x220008, true, 12, 4, "FEFF000002", [&](Device d) { d.InportWord(0xFFFE); }},
      {0x22000C, true, 12, 4, "F80C000004", [&](Device d) { d.InportDword(0xCF8); }},
      {0x220010, true, 12, 1, "2E0000000100000087", [&](Device d) { d.OutportByte(0x2E, 0x87); }},
      {0x220014, true, 12, 0, "2E000000020000006587", [&](Device d) { d.OutportWord(0x2E, 0x8765); }},
      {0x220018, true, 12, 0, "2E0000000400000021436587", [&](Device d) { d.OutportDword(0x2E, 0x87654321); }},
      {0x220040, true, 16, 16, "000000003412560081", [&](Device d) { d.ReadPciConfigByte(0x1234, 0x56, byte); }},
      {0x220044, true, 16, 16, "000000003412560181", [&](Device d) { d.ReadPciConfigWord(0x1234, 0x156, word); }},
      {0x220048, true, 16, 16, "000000003412560081", [&](Device d) { d.ReadPciConfigDword(0x1234, 0x56, dword); }},
      {0x22004C, true, 16, 16, "9A0000003412560081", [&](Device d) { d.WritePciConfigByte(0x1234, 0x56, 0x9A); }},
      {0x220050, true, 16, 16, "BC9A00003412560081", [&](Device d) { d.WritePciConfigWord(0x1234, 0x56, 0x9ABC); }},
      {0x220054, true, 16, 16, "04030201341256008100",
       [&](Device d) { d.WritePciConfigDword(0x1234, 0x56, 0x1020304); }},
      {0x22003C, true, 16, 16, "000000008680021C0300000081",
       [&](Device d) { d.FindPciDevice(0x8086, 0x1C02, 3, word); }},
      {0x220058, true, 16, 16, "00010600000000000200000081", [&](Device d) { d.FindPciClass(0x060100, 2, word); }},
      {0x2200A8, false, 20, 20, "10F4D1FE07", [&](Device d) { d.ReadPhysicalMemory(0xFED1F410, 7, buffer); }},
      {0x2200A8, true, 40, 40, "10F4D1FE0000000007", [&](Device d) { d.ReadPhysicalMemory(0xFED1F410, 7, buffer); }},
      {0x2200A8, false, 20, 20, "0010000007", [&](Device d) { d.ReadPhysicalMemory64(0x1000, 5, 7, buffer); }},
      {0x2200A8, true, 40, 40, "001000000500000007", [&](Device d) { d.ReadPhysicalMemory64(0x1000, 5, 7, buffer); }},
      {0x2200A8, false, 40, 40, "001000000500000007",
       [&](Device d) { d.WritePhysicalMemory64(0x1000, 5, 7, buffer); }},
      {0x2200A8, true, 20, 20, "0010000010", [&](Device d) { d.MapPhysicalMemory(0x1000, 16, nullptr); }},
      {0x222498, true, 8, 8, "000000009901", [&](Device d) { d.ReadMsr(msr); }},
      {0x220020, true, 6, 2, "12F003", [&](Device d) { d.ReadFirmwareByte(0xF012, 3); }},
      {0x22001C, true, 6, 2, "12F003", [&](Device d) { d.ReadFirmwareWord(0xF012, 3); }},
  };
  for (const auto& c : kCases) {
    Simulation machine(Machine(c.is64Bit), {});
    CDevio devio;
    machine.Trace().Keep();
    c.send(devio);
    const DriverRequest& request = machine.Trace().Requests().at(0);
    std::string record = c.record;
    record.resize(2 * c.size, '0');
    EXPECT_EQ(request.code, c.code) << c.record;
    EXPECT_EQ(Hex(request.in), record) << std::hex << c.code;
    EXPECT_EQ(request.out.size(), c.answerSize) << std::hex << c.code;
  }
}

// Without a driver, and with one that reports a failure, whatever stands in the record that it gives back.
TEST(CDevio, AnswersWithNothingWhereNothingIsDone) {
  MachineDescription absent = Machine(true);
  absent.driver.present = false;
  MachineDescription failing = Machine(true);
  failing.driver.refused = {0x220004, 0x220008, 0x22000C, 0x220010, 0x220014, 0x22003C, 0x220040,
                            0x220044, 0x220048, 0x220058, 0x2200A8, 0x2200C8, 0x222498};
  failing.driver.registers = {{0x199, 7}};
  MachineDescription failing32 = failing;
  failing32.is64Bit = false;
  for (const MachineDescription& description : {absent, failing, failing32}) {
    Simulation machine(description, {});
    CDevio d;
    machine.Trace().Keep();
    std::uint8_t byte = 1;
    std::uint16_t word = 1;
    std::uint16_t location = 1;
    std::uint16_t ofClass = 1;
    std::uint32_t dword = 1;
    std::uint64_t msr = 0x199;
    std::vector<std::byte> buffer(4, std::byte{7});
    CDevio::MappingRecord mapping{1, 2, 3, 4, 5};
    const std::vector<int> statuses{d.ReadPciConfigByte(kSerial, 0, byte), d.ReadPciConfigWord(kSerial, 0, word),
                                    d.ReadPciConfigDword(kSerial, 0, dword),
                                    d.FindPciDevice(0x8086, 0x1C02, 0, location),
                                    d.FindPciClass(0x060100, 1, ofClass)};
    EXPECT_EQ(byte + word + dword + location + ofClass, 0U);
    EXPECT_EQ(d.InportByte(0x80) + d.InportWord(0x80) + d.InportDword(0x80), 0U);
    EXPECT_FALSE(d.OutportByte(0x80, 0) || d.OutportWord(0x80, 0));
    EXPECT_EQ(d.ReadPhysicalMemory(0x1000, 4, buffer) + d.ReadPhysicalMemory64(0x1000, 0, 4, buffer), 0U);
    EXPECT_EQ(d.WritePhysicalMemory(0x1000, 4, buffer) + d.WritePhysicalMemory64(0x1000, 0, 4, buffer), 0U);
    EXPECT_EQ(buffer, std::vector<std::byte>(4, std::byte{7}));
    EXPECT_EQ(d.MapPhysicalMemory(0x1000, 4, &mapping), 0U);
    EXPECT_FALSE(d.UnmapPhysicalMemory(mapping));
    EXPECT_THAT(mapping, ElementsAre(1U, 2U, 3U, 4U, 5U));
    EXPECT_EQ(d.ReadMsr(msr), description.driver.present ? 31U : 6U);  // refused, or an invalid handle
    EXPECT_EQ(msr, 0x199U);
    if (!description.driver.present) {
      EXPECT_THAT(statuses, testing::Each(0x81));
      EXPECT_EQ(d.WritePciConfigByte(0, 0, 0) & d.WritePciConfigWord(0, 0, 0) & d.WritePciConfigDword(0, 0, 0), 0x81);
      EXPECT_EQ(d.ReadPciBar(0, 0x10, msr), 0x81);
      EXPECT_FALSE(d.FindPciDeviceByIds(0, 0, 0, 0, 0, location));
      EXPECT_EQ(d.ReadFirmwareByte(0xF000, 0) + d.ReadFirmwareWord(0xF000, 0), 0);
      EXPECT_EQ(d.GetLoadState(), CDevio::LoadState::kNoBinary);
      EXPECT_TRUE(machine.Trace().Requests().empty());
    }
  }
}

// ---- PCI

TEST_F(CDevioTest, FindsFunctionsByClassAndIds) {
  EXPECT_EQ(devio_.FindPciClass(0x060100, 1, location_), 0);
  EXPECT_EQ(location_, kSerial);
  EXPECT_NE(devio_.FindPciClass(0x060100, 2, location_), 0);
  EXPECT_EQ(location_, 0);
  EXPECT_EQ(devio_.FindPciDevice(0x10EC, 0x8168, 0, location_), 0);
  EXPECT_EQ(location_, kNetwork);
  EXPECT_TRUE(devio_.FindPciDeviceByIds(0x060100, 0x8086, 0x1C02, 0x103C, 0x3048, location_));
  EXPECT_EQ(location_, kSerial);
  EXPECT_FALSE(devio_.FindPciDeviceByIds(0x060100, 0x8086, 0x1C02, 0x103C, 0x3049, location_));
  EXPECT_FALSE(devio_.FindPciDeviceByIds(0x060100, 0x10EC, 0x8168, 0x103C, 0x3048, location_));  // of another class
  EXPECT_EQ(location_, 0);
}

// By a function's place among those of its class whose description in the device tree has the name.
TEST_F(CDevioTest, FindsFunctionsByName) {
  PciDeviceList::Forget();
  const std::tuple<const char*, unsigned, std::uint16_t> kCases[] = {
      {"Link", 0, kBridge}, {"Link", 1, kSerial}, {"Link", 2, 0}, {"Link #2", 0, kSerial}, {"link", 0, 0}};
  for (const auto& [name, occurrence, found] : kCases) {
    EXPECT_EQ(devio_.FindPciDeviceByName(0x060100, name, occurrence, location_), found != 0) << name << occurrence;
    EXPECT_EQ(location_, found) << name << occurrence;
  }
  PciDeviceList::Forget();
}

TEST_F(CDevioTest, ReadsAndWritesConfigurationOfEachWidth) {
  std::uint8_t byte = 0;
  std::uint16_t word = 0;
  std::uint32_t dword = 0;
  EXPECT_EQ(devio_.ReadPciConfigByte(kSerial, 0x03, byte), 0);
  EXPECT_EQ(devio_.ReadPciConfigWord(kSerial, 0x02, word), 0);
  EXPECT_EQ(devio_.ReadPciConfigDword(kSerial, 0x00, dword), 0);
  EXPECT_EQ(byte, 0x1C);
  EXPECT_EQ(word, 0x1C02);
  EXPECT_EQ(dword, 0x1C028086U);
  EXPECT_EQ(devio_.WritePciConfigWord(kSerial, 0x42, 0xBEEF), 0);
  EXPECT_EQ(devio_.WritePciConfigByte(kSerial, 0x41, 0x77), 0);
  EXPECT_EQ(devio_.ReadPciConfigDword(kSerial, 0x40, dword), 0);
  EXPECT_EQ(dword, 0xBEEF7700U);
  EXPECT_NE(devio_.ReadPciConfigDword(0x0700, 0x00, dword), 0);
  EXPECT_EQ(dword, 0U);
}

TEST(CDevio, ReadsBaseAddressesWithoutTheirFlagBits) {
  const struct {
    std::uint32_t low;
    std::uint32_t high;
    std::uint64_t base;
  } kCases[] = {
      {0xFEDC000A, 0x11111111, 0xFEDC0000},    // memory, 32 bits
      {0xFEDC000C, 0x00000012, 0x12FEDC0000},  // memory, 64 bits
      {0x0000100B, 0x11111111, 0x1008},        // I/O
      {0x00001005, 0x00000002, 0x200001004},   // I/O with the 64-bit flag: the flag belongs to the address as well
  };
  for (const auto& c : kCases) {
    MachineDescription description;
    description.pci = {{kSerial, {{0x10, c.low}, {0x14, c.high}}}};
    Simulation machine(description, {});
    CDevio devio;
    std::uint64_t base = 1;
    EXPECT_EQ(devio.ReadPciBar(kSerial, 0x10, base), 0);
    EXPECT_EQ(base, c.base) << std::hex << c.low;
    EXPECT_NE(devio.ReadPciBar(0x0700, 0x10, base), 0);
    EXPECT_EQ(base, 0U);
  }
}

// ---- memory and others

TEST(CDevio, CopiesPhysicalMemoryOfAnyLength) {
  for (const bool is64Bit : {false, true}) {
    Simulation machine(Machine(is64Bit), {});
    machine.Trace().Keep();
    CDevio devio;
    const std::vector<std::byte> written(7, std::byte{0xA5});
    std::vector<std::byte> read(9);
    EXPECT_EQ(devio.WritePhysicalMemory(0x2001, 7, written), 7U);
    EXPECT_EQ(devio.ReadPhysicalMemory(0x2001, 7, read), 7U);
    EXPECT_EQ(Hex(read), "A5A5A5A5A5A5A50000");
    std::string accesses;
    for (const DriverRequest& request : machine.Trace().Requests()) {
      const std::string text = Describe(request);
      const std::size_t at = text.find("memory ");
      accesses += at == std::string::npos ? "" : text.substr(at + 7) + "; ";
    }
    EXPECT_EQ(accesses,
              "00002001 <- A5 A5 A5 A5; 00002005 <- A5; 00002006 <- A5; 00002007 <- A5; "
              "00002001 -> A5 A5 A5 A5; 00002005 -> A5; 00002006 -> A5; 00002007 -> A5; ");
    EXPECT_EQ(devio.ReadPhysicalMemory64(0x2001, 0, 7, read), 7U);
    EXPECT_EQ(machine.Trace().Requests().back().code, DriverRequest::kMappedRead);
    EXPECT_EQ(devio.ReadPhysicalMemory(0x2001, 100, read), 9U);  // no more than the buffer holds
    EXPECT_EQ(devio.ReadPhysicalMemory(0x2001, 0, read), 0U);    // which this driver refuses
  }
}

TEST_F(CDevioTest, ReleasesAMappingOnce) {
  CDevio::MappingRecord mapping{};
  const std::uint32_t mapped = devio_.MapPhysicalMemory(0x3000, 16, &mapping);
  EXPECT_NE(mapped, 0U);
  EXPECT_THAT(mapping, ElementsAre(0x3000U, 16U, mapped, testing::_, testing::_));
  machine_.Trace().Keep();
  const CDevio::MappingRecord released = mapping;
  EXPECT_TRUE(devio_.UnmapPhysicalMemory(mapping));
  EXPECT_EQ(mapping, CDevio::MappingRecord{});
  EXPECT_EQ(machine_.Trace().Requests().front().code, 0x2200C8U);
  EXPECT_EQ(machine_.Trace().Requests().front().in.size(), 20U);
  mapping = released;
  EXPECT_FALSE(devio_.UnmapPhysicalMemory(mapping));
  EXPECT_EQ(mapping, released);
}

TEST_F(CDevioTest, ReadsTheFirmwareSegmentAndGivesTheErrorOfARefusedRegister) {
  std::uint64_t value = 0x199;
  EXPECT_EQ(devio_.ReadMsr(value), 87U);
  EXPECT_EQ(value, 0x199U);
  EXPECT_EQ(devio_.ReadFirmwareWord(0xF000, 1), 'S' | 'M' << 8);
  EXPECT_EQ(devio_.ReadFirmwareByte(0xF000, 3), '_');
}

TEST(CDevio, ReadsAModelSpecificRegisterOf64Bits) {
  MachineDescription description = Machine(true);
  description.driver.registers = {{0x199, 0x1122334455667788}};
  Simulation machine(description, {});
  std::uint64_t value = 0xFFFFFFFF00000199;
  EXPECT_EQ(CDevio().ReadMsr(value), 0U);
  EXPECT_EQ(value, 0x1122334455667788U);
}

// ---- the driver's service

TEST(CDevio, IsLoadedUnderPresentOlderOrGivenNames) {
  for (const bool older : {false, true}) {
    MachineDescription description;
    description.driver.olderSet = older;
    Simulation machine(description, {});
    EXPECT_TRUE(CDevio().IsDriverLoaded());
    EXPECT_EQ(CDevio("Nvntsk", "Norvane Tsk", "Nvntsk").IsDriverLoaded(), older);
    EXPECT_FALSE(CDevio("Nvntsk", "Norvane Tsk", "other", "x.sys").IsDriverLoaded());
  }
}

TEST(CDevio, LogsTheDriversVersionInItsTwoForms) {
  const struct {
    DriverDescription driver;
    const char* line;
  } kCases[] = {
      {{.version = 305, .services = {}}, "tmbhalcyon.sys version 3.5. "},
      {{.version = 0xFFE, .services = {}}, "tmbhalcyon.sys version 40.94. "},
      {{.version = 0xFFF, .services = {}}, "tmbhalcyon.sys version  0.00 64bit. "},
      {{.version = 0x04013000, .services = {}}, "tmbhalcyon.sys version  4.01 32bit. "},
      {{.version = 0x0C226907, .services = {}}, "tmbhalcyon.sys version 12.34 beta 7 64bit. "},
      // The two forms name the older driver differently; without one the version is 0.
      {{.olderSet = true, .version = 305, .services = {}}, "Norvane Tsk.sys version 3.5. "},
      {{.olderSet = true, .version = 0x04013000, .services = {}}, "Nvntsk.sys version  4.01 32bit. "},
      {{.present = false, .olderSet = true, .services = {}}, "Norvane Tsk.sys version 0.0. "},
  };
  for (const auto& [driver, line] : kCases) {
    MachineDescription description;
    description.driver = driver;
    Simulation machine(description, {});
    CDevio().LogDriverVersion();
    EXPECT_EQ(machine.Output(), std::string("LogMessage 14 20000 \"") + line + "\" \"\"\n");
  }
}

}  // namespace
}  // namespace panelglow
