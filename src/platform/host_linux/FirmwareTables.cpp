#include "platform/host_linux/FirmwareTables.h"

#include <algorithm>
#include <array>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>

namespace panelglow::platform::host_linux {

namespace {

constexpr std::size_t kLongestTable = std::size_t{1} << 20U;
constexpr std::size_t kHeaderSize = 4;  // type, length, handle
constexpr std::uint8_t kEndOfTable = 127;
constexpr std::size_t kLongestString = 255;

// The length of the structure at `begin` with its strings, which two NULs end; 0 when it is not whole.
std::size_t StructureSize(std::string_view table, std::size_t begin) {
  if (table.size() - begin < kHeaderSize) {
    return 0;
  }
  const std::size_t formatted = static_cast<std::uint8_t>(table[begin + 1]);
  if (formatted < kHeaderSize || formatted > table.size() - begin) {
    return 0;
  }
  const std::size_t end = table.find(std::string_view("\0\0", 2), begin + formatted);
  return end == std::string_view::npos ? 0 : end + 2 - begin;
}

// The table up to its end-of-table structure: what may stand behind that is the rest of the memory set aside. A table
// that cannot be followed so far stays as it is, as its reader has rules of its own for tables that are not well
// formed; one whose first structure is not whole is none.
std::string_view TrimmedTable(std::string_view table) {
  if (StructureSize(table, 0) == 0) {
    return {};
  }
  for (std::size_t end = 0; end < table.size();) {
    const std::size_t size = StructureSize(table, end);
    if (size == 0) {
      break;
    }
    const auto type = static_cast<std::uint8_t>(table[end]);
    end += size;
    if (type == kEndOfTable) {
      return table.substr(0, end);
    }
  }
  return table;
}

// A table of what the kernel shows to everybody.
class FieldTable {
 public:
  explicit FieldTable(std::string folder) : folder_(std::move(folder)) {}

  // A structure of `size` bytes with the strings of the named fields; each field's offset takes its string's number.
  struct Field {
    std::size_t offset;
    const char* name;
  };
  void Add(std::uint8_t type, std::size_t size, std::initializer_list<Field> fields,
           std::initializer_list<std::pair<std::size_t, std::uint8_t>> bytes = {}) {
    std::vector<std::uint8_t> structure(size, 0);
    structure[0] = type;
    structure[1] = static_cast<std::uint8_t>(size);
    structure[2] = handle_++;
    for (const auto& [offset, byte] : bytes) {
      structure[offset] = byte;
    }
    std::uint8_t strings = 0;
    for (const Field& field : fields) {
      const std::string text = ReadKernelText(folder_ + field.name).substr(0, kLongestString);
      if (!text.empty()) {
        structure[field.offset] = ++strings;
        structure.insert(structure.end(), text.begin(), text.end());
        structure.push_back(0);
      }
    }
    structure.insert(structure.end(), strings == 0 ? 2 : 1, 0);
    isEmpty_ = isEmpty_ && strings == 0;
    table_.insert(table_.end(), structure.begin(), structure.end());
  }

  [[nodiscard]] std::vector<std::uint8_t> Take() {
    return isEmpty_ ? std::vector<std::uint8_t>() : std::move(table_);
  }

 private:
  const std::string folder_;
  std::vector<std::uint8_t> table_;
  std::uint8_t handle_ = 0;
  bool isEmpty_ = true;
};

std::vector<std::uint8_t> TableOfFields(const std::string& folder) {
  const auto enclosure = static_cast<std::uint8_t>(ReadKernelNumber(folder + "chassis_type", 0x7F).value_or(0));
  FieldTable table(folder);
  table.Add(0, 18, {{4, "bios_vendor"}, {5, "bios_version"}, {8, "bios_date"}});
  table.Add(
      1, 27,
      {{4, "sys_vendor"}, {5, "product_name"}, {6, "product_version"}, {25, "product_sku"}, {26, "product_family"}});
  table.Add(2, 8, {{4, "board_vendor"}, {5, "board_name"}, {6, "board_version"}});
  table.Add(3, 9, {{4, "chassis_vendor"}, {6, "chassis_version"}}, {{5, enclosure}});
  table.Add(kEndOfTable, kHeaderSize, {});
  return table.Take();
}

}  // namespace

std::vector<std::uint8_t> ReadFirmwareTable(const KernelFolders& folders) {
  const std::string bytes =
      ReadKernelBytes(folders.sys + "/firmware/dmi/tables/DMI", kLongestTable).value_or(std::string());
  const std::string_view table = TrimmedTable(bytes);
  if (!table.empty()) {
    return {table.begin(), table.end()};
  }
  return TableOfFields(folders.sys + "/class/dmi/id/");
}

}  // namespace panelglow::platform::host_linux
