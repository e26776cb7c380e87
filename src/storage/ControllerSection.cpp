#include "storage/ControllerSection.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <memory>
#include <string_view>
#include <utility>

#include "config/FileLock.h"
#include "config/OrgFileParser.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "harness/base/Notices.h"
#include "hw/PciDeviceList.h"
#include "hw/WMIDiscovery.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kListUnusable = 990294;
constexpr const char* kWorkFile = "\\tmpmsctrl.ini";
constexpr const char* kKeyPrefix = "ENTRY";

// Kinds of controllers that are reached through a library.
constexpr int kStorageLibrary = 4;
constexpr int kStorageLibraryIr = 5;
constexpr std::array<std::string_view, 8> kKindWords{"csmi", "scsi", "wind", "stor", "sto2", "cssc", "cswn", "wmi"};

constexpr std::size_t kLongestWord = 512;  // with its NUL
constexpr std::size_t kLongestName = 256;
constexpr unsigned long kLargestId = 0xFFFF;
constexpr std::size_t kLongestQuotation = 80;  // of a line in a notice

constexpr const char* kControllerFields =
    "vendor id, device id, subsystem vendor id, subsystem device id, interface, name";
constexpr const char* kNvsFields = "vendor id, device id, product text, interface, name";

[[noreturn]] void FailList(const std::string& file, const std::string& section) {
  auto failure = std::make_unique<CDMException>(kListUnusable);
  failure->addMessage(static_cast<LogOptions>(0), -1, file);
  failure->addMessage(static_cast<LogOptions>(0), -1, section);
  throw failure.release();  // owned by whoever catches it
}

std::string ReadWord(FileParser& parser) {
  std::array<char, kLongestWord> room{};
  parser.NextFieldText(room);
  return room.data();
}

std::string ReadName(FileParser& parser) {
  std::array<char, kLongestName> room{' '};
  parser.NextFieldText(room);
  return room.data();
}

// A whole text that is a number of 16 bits.
bool IsId(const std::string& text) {
  char* end = nullptr;
  const bool hasDigit = !text.empty() && text.front() >= '0' && text.front() <= '9';
  return hasDigit && std::strtoul(text.c_str(), &end, 0) <= kLargestId && *end == '\0';
}

}  // namespace

int InterfaceKindOf(const std::string& word) {
  const auto found = std::find_if(kKindWords.begin(), kKindWords.end(),
                                  [&](std::string_view kind) { return CDMUtil::EqualIgnoreCase(kind, word); });
  return found == kKindWords.end() ? 1 : static_cast<int>(found - kKindWords.begin()) + 1;
}

ControllerSection::ControllerSection(std::string iniFile, std::string section, bool sataFlag)
    : iniFile_(std::move(iniFile)), section_(std::move(section)), isNvs_(section_ == kNvsSection) {
  record_.sataFlag = sataFlag;
}

void ControllerSection::Load(std::list<CTRL_INFO>& out, bool& removesOld) {
  const FileLock ini(iniFile_);  // to the end
  const std::string workFile = platform::TheHost().files.CurrentDirectory() + kWorkFile;
  const FileLock turn(workFile);  // of another INI file's reader, too
  const std::vector<std::string> lines = ReadLines(workFile, removesOld);
  FileParser parser(workFile);
  int entry = 0;
  for (const std::string& line : lines) {
    ++entry;
    if (line.empty()) {
      continue;
    }
    try {
      parser.SplitLine(line);
    } catch (int) {
      TellOfLine(entry, line, "has a quotation mark that is not closed");
      throw;
    }
    TellWhatIsOdd(parser, entry, line);
    LoadLine(parser, out);
  }
}

// ---- the lines

// The section's lines as they come back from the work file.
std::vector<std::string> ControllerSection::ReadLines(const std::string& workFile, bool& removesOld) const {
  OrgFileParser source(iniFile_);
  platform::Files& files = platform::TheHost().files;
  if (removesOld && files.CanRead(workFile)) {
    removesOld = false;
    files.Remove(workFile);
  }
  try {
    if (source.ReadSection(section_) == 0) {
      TellOfSection(files.CanRead(iniFile_) ? "there are no lines in it, or no such section"
                                            : "the file is missing or cannot be read");
      FailList(iniFile_, section_);
    }
    if (source.ReadValue(section_, std::string(kKeyPrefix) + "0")) {
      TellOfSection("it has a key ENTRY0, as only the work file of this program may; its lines have no keys");
      FailList(iniFile_, section_);
    }
  } catch (int) {
    TellOfSection("it is longer than can be read, or its key ENTRY0 has a quotation mark that is not closed");
    throw;
  }
  source.SetPrefix(kKeyPrefix);
  source.SetTargetPath(workFile);
  try {
    source.EraseSection(section_);
    source.AppendLines(section_);
  } catch (int) {
    Notices::Tell("the work file " + workFile + " cannot be written, so the controllers are read from " + iniFile_ +
                  " without it; let this user write in the current folder");
    std::vector<std::string> lines;
    std::transform(source.GetLines().begin(), source.GetLines().end(), std::back_inserter(lines),
                   &FileParser::AsValue);
    return lines;
  }
  std::vector<std::string> lines = FileParser(workFile).ReadNumberedValues(section_, kKeyPrefix);
  if (lines.empty()) {
    FailList(workFile, section_);
  }
  return lines;
}

void ControllerSection::LoadLine(FileParser& parser, std::list<CTRL_INFO>& out) {
  record_.productText.clear();
  ReadIds(parser);
  const std::string word = ReadWord(parser);
  if (isNvs_ && InterfaceKindOf(word) == kManagementKind) {
    AddByManagement(parser, out);
  } else {
    AddByInventory(parser, word, out);
  }
}

void ControllerSection::ReadIds(FileParser& parser) {
  parser.NextFieldNumber(record_.vendorId, 0);
  parser.NextFieldNumber(record_.deviceId, 0);
  if (isNvs_) {
    parser.NextFieldString(record_.productText);
  } else {
    parser.NextFieldNumber(record_.subVendorId, 0);
    parser.NextFieldNumber(record_.subDeviceId, 0);
  }
}

void ControllerSection::AddByInventory(FileParser& parser, const std::string& word, std::list<CTRL_INFO>& out) {
  if (PciDeviceList::Instance().CountDevices(record_.vendorId, record_.deviceId, record_.subVendorId,
                                             record_.subDeviceId) == 0) {
    return;
  }
  record_.interfaceKind = KindForThisMachine(InterfaceKindOf(word));
  record_.name = ReadName(parser);
  out.push_back(record_);
}

// The name is taken by the first row that matches; a further one finds none left.
void ControllerSection::AddByManagement(FileParser& parser, std::list<CTRL_INFO>& out) {
  record_.interfaceKind = kManagementKind;
  WMIDiscovery& management = WMIDiscovery::Instance();
  const int rows = management.RunQuery(u"SELECT * FROM Win32_SCSIController");
  const std::string vendor = CDMUtil::ToHexString(static_cast<int>(record_.vendorId));
  const std::string device = CDMUtil::ToHexString(static_cast<int>(record_.deviceId));
  for (int row = 0; row < rows; ++row) {
    std::string id;
    management.GetCurrentValue(u"PNPDeviceID", id, row);
    if (id.find(vendor) != std::string::npos && id.find(device) != std::string::npos &&
        id.find(record_.productText) != std::string::npos) {
      record_.name = ReadName(parser);
      out.push_back(record_);
    }
  }
}

// Controllers of two libraries are reached through plain SCSI where the library is missing.
int ControllerSection::KindForThisMachine(int kind) {
  if (kind != kStorageLibrary && kind != kStorageLibraryIr) {
    return kind;
  }
  const std::string library = kind == kStorageLibrary ? "storelib.dll" : "storelibIR-2.dll";
  if (platform::TheHost().modules.CanLoad(library)) {
    return kind;
  }
  warnings_.push_back("WARNING! Could not find " + library + ", switching to scsi!");
  CDMout::LogMessage(LogOptions::Debug, kFreeText, warnings_.back());
  return kScsiKind;
}

// ---- what is told to people

// The line is used all the same, as far as it goes.
void ControllerSection::TellWhatIsOdd(FileParser& parser, int entry, const std::string& line) const {
  const int ids = isNvs_ ? 2 : 4;
  const int wanted = isNvs_ ? 5 : 6;
  if (parser.GetFieldCount() < wanted) {
    TellOfLine(entry, line,
               "has " + CDMUtil::ToString(parser.GetFieldCount()) + " fields and needs " + CDMUtil::ToString(wanted) +
                   ": " + (isNvs_ ? kNvsFields : kControllerFields));
  }
  for (int i = 0; i < std::min(ids, parser.GetFieldCount()); ++i) {
    const std::string& field = parser.GetField(static_cast<std::size_t>(i));
    if (!IsId(field)) {
      TellOfLine(entry, line, "has \"" + field.substr(0, kLongestQuotation) + "\" where a number of 16 bits belongs");
    }
  }
}

void ControllerSection::TellOfLine(int entry, const std::string& line, const std::string& what) const {
  TellOfSection("its line " + CDMUtil::ToString(entry) + " (comments and blank lines not counted), " +
                line.substr(0, kLongestQuotation) + ", " + what);
}

void ControllerSection::TellOfSection(const std::string& what) const {
  Notices::Tell("the mass-storage file " + iniFile_ + ", section [" + section_ + "]: " + what);
}

}  // namespace panelglow
