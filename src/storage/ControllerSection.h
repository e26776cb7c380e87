// One section of the mass-storage INI file: the controllers that it names and that are in this machine.
#pragma once

#include <list>
#include <string>
#include <vector>

#include "config/FileParser.h"
#include "storage/CtrlInfo.h"

namespace panelglow {

inline constexpr const char* kSataSection = "SATA CONTROLLERS";
inline constexpr const char* kSasSection = "SAS CONTROLLERS";
inline constexpr const char* kNvsSection = "NON VOLATILE STORAGE CONTROLLERS";

class ControllerSection {
 public:
  /// `sataFlag` is carried along with each record.
  ControllerSection(std::string iniFile, std::string section, bool sataFlag);

  /// Appends the controllers in file order. The section's lines stand under numbered keys in a work file in the
  /// current directory afterwards; where that cannot be written they are taken as they are. `removesOld`: an old work
  /// file is removed first, and the flag then cleared. Throws a CDMException (990294) for a section that has no lines
  /// or the key "ENTRY0", and what the parsers and the management service throw.
  void Load(std::list<CTRL_INFO>& out, bool& removesOld);

  /// Log lines of the load, which were written when they came up.
  [[nodiscard]] const std::vector<std::string>& Warnings() const { return warnings_; }

 private:
  std::vector<std::string> ReadLines(const std::string& workFile, bool& removesOld) const;
  void LoadLine(FileParser& parser, std::list<CTRL_INFO>& out);
  void ReadIds(FileParser& parser);
  void AddByInventory(FileParser& parser, const std::string& word, std::list<CTRL_INFO>& out);
  void AddByManagement(FileParser& parser, std::list<CTRL_INFO>& out);
  [[nodiscard]] int KindForThisMachine(int kind);
  void TellWhatIsOdd(FileParser& parser, int entry, const std::string& line) const;
  void TellOfLine(int entry, const std::string& line, const std::string& what) const;
  void TellOfSection(const std::string& what) const;

  std::string iniFile_;
  std::string section_;
  bool isNvs_;
  CTRL_INFO record_;  // of the present line; a number that a line lacks is that of the line before
  std::vector<std::string> warnings_;
};

/// "csmi" 1, "scsi" 2, "wind" 3, "stor" 4, "sto2" 5, "cssc" 6, "cswn" 7, "wmi" 8, in any case; any other word 1.
int InterfaceKindOf(const std::string& word);

inline constexpr int kScsiKind = 2;
inline constexpr int kManagementKind = 8;

}  // namespace panelglow
