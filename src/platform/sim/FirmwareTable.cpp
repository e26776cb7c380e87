#include "platform/sim/FirmwareTable.h"

#include <algorithm>
#include <string>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint32_t kTableOffset = 0x100;  // in the segment, behind the entry point

class TableBuilder {
 public:
  // One structure: formatted fields behind the four header bytes, then its strings.
  void Add(std::uint8_t type, const std::vector<std::uint8_t>& fields, const std::vector<std::string>& strings) {
    table_.push_back(type);
    table_.push_back(static_cast<std::uint8_t>(fields.size() + 4));
    table_.push_back(static_cast<std::uint8_t>(handle_));
    table_.push_back(static_cast<std::uint8_t>(handle_ >> 8U));
    ++handle_;
    table_.insert(table_.end(), fields.begin(), fields.end());
    for (const std::string& text : strings) {
      table_.insert(table_.end(), text.begin(), text.end());
      table_.push_back(0);
    }
    table_.push_back(0);
    if (strings.empty()) {
      table_.push_back(0);
    }
  }

  [[nodiscard]] std::vector<std::uint8_t> Take() { return std::move(table_); }
  [[nodiscard]] unsigned Count() const { return handle_; }

 private:
  std::vector<std::uint8_t> table_;
  unsigned handle_ = 0;
};

unsigned CountStructures(const FirmwareDescription& firmware) {
  return static_cast<unsigned>(5 + firmware.processors.size());
}

}  // namespace

std::vector<std::uint8_t> BuildFirmwareTable(const FirmwareDescription& firmware) {
  if (firmware.rawTable) {
    return *firmware.rawTable;
  }
  TableBuilder table;
  // 0, BIOS information: vendor, version, segment, release date, ROM size, characteristics.
  table.Add(0, {1, 2, 0x00, 0xF0, 3, 0x0F, 0x80, 0, 0, 0, 0, 0, 0, 0}, {"Panelglow BIOS", "1.00", "03/01/2024"});
  // 1, system information: manufacturer, product, version, serial, UUID, wake-up, SKU, family.
  table.Add(1, {1,    2,    3,    4,    0x33, 0x22, 0x11, 0x00, 0x55, 0x44, 0x77, 0x66,
                0x88, 0x99, 0xAA, 0xBB, 0xCC, 0xDD, 0xEE, 0xFF, 6,    5,    6},
            {firmware.boardManufacturer, firmware.systemProduct, "A1", "SIM0001", "SKU1", "Simulated"});
  // 2, base board: manufacturer, product, version, serial.
  if (firmware.boardProduct.empty()) {
    table.Add(2, {1, 0, 0, 2}, {firmware.boardManufacturer, firmware.boardSerial});
  } else {
    table.Add(2, {1, 2, 0, 3}, {firmware.boardManufacturer, firmware.boardProduct, firmware.boardSerial});
  }
  // 3, enclosure: manufacturer, type.
  table.Add(3, {1, 0x03, 0, 0, 0, 3, 3, 3, 3}, {firmware.boardManufacturer});
  for (const ProcessorDescription& processor : firmware.processors) {
    // 4, processor: socket, type, family, manufacturer, id, version, voltage, clocks, status (populated, enabled).
    table.Add(4, {1,    3,    processor.family,
                  2,    0,    0,
                  0,    0,    0,
                  0,    0,    0,
                  3,    0x8C, 100,
                  0,    0x10, 0x0E,
                  0x10, 0x0E, 0x41,
                  1,    0,    0,
                  0,    0,    0,
                  0,    0,    0,
                  0,    4,    4,
                  8},
              {"CPU 0", processor.manufacturer, "Simulated processor"});
  }
  table.Add(127, {}, {});
  return table.Take();
}

std::vector<std::uint8_t> BuildFirmwareSegment(const FirmwareDescription& firmware) {
  std::vector<std::uint8_t> segment(0x10000, 0);
  std::vector<std::uint8_t> table = BuildFirmwareTable(firmware);
  table.resize(std::min<std::size_t>(table.size(), segment.size() - kTableOffset));
  const std::uint32_t address = kFirmwareSegment + kTableOffset;
  const auto word = [&](std::size_t offset, std::uint32_t value) {
    segment[offset] = static_cast<std::uint8_t>(value);
    segment[offset + 1] = static_cast<std::uint8_t>(value >> 8U);
  };
  std::copy_n("_SM_", 4, segment.begin());
  segment[5] = 0x1F;
  word(6, 0x0402);  // major 2, minor 4
  word(22, static_cast<std::uint32_t>(table.size()));
  word(24, address & 0xFFFFU);
  word(26, address >> 16U);
  word(28, CountStructures(firmware));
  std::copy(table.begin(), table.end(), segment.begin() + kTableOffset);
  return segment;
}

}  // namespace panelglow::platform::sim
