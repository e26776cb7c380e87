// The one reader of the files that describe a board: a test file over a detection file, the section of this very
// system over a common one, and for chip settings a file of chip definitions in which a section can build on another.
#pragma once

#include <map>
#include <mutex>
#include <optional>
#include <string>

#include "board/base/Setting.h"
#include "config/IniFile.h"

namespace panelglow {

/// Safe to use from several threads: a board is selected, and some settings are looked up, outside the board
/// library's mutex. Where two of them select different files, the last one counts.
class IniReader {
 public:
  /// What a look-up found. A key set to "undef" hides the same key in everything behind it.
  enum status_t { kNotFound = 0, kUndefined = 1, kFound = 2 };

  /// The process-wide reader, with the default paths until it is given others.
  static IniReader& Instance();

  /// The same, set to these values at once; only the chip file stays the one that was read first.
  static IniReader& Instance(const std::string& systemId, const std::string& detectIni, const std::string& testIni,
                             const std::string& chipIni);

  IniReader() = default;
  IniReader(const std::string& systemId, const std::string& detectIni, const std::string& testIni,
            const std::string& chipIni);
  virtual ~IniReader() = default;

  /// Typed reads of the layered files: status kFound gives the value, kUndefined an empty text or 0, kNotFound the
  /// default. Numbers are decimal, or hexadecimal behind "0x"; any other text is 0, and people are told of it.
  std::string ReadIniValue(const std::string& key, status_t& status, const std::string& defaultValue);
  int ReadIniInt(const std::string& key, status_t& status, int defaultValue);
  /// People are told of a number that does not fit into `bits`, which is what the caller keeps of it.
  unsigned int ReadIniUnsigned(const std::string& key, status_t& status, unsigned int defaultValue,
                               unsigned bits = 32);

  /// Typed reads of a chip section; "chip.<section>.<key>" in the layered files comes first.
  std::string ReadChipValue(const std::string& chipSection, const std::string& key, status_t& status,
                            const std::string& defaultValue);
  /// People are told of a number that does not fit into `bits`, which is what the caller keeps of it.
  int ReadChipInt(const std::string& chipSection, const std::string& key, status_t& status, int defaultValue,
                  unsigned bits = kIntBits);

  /// A text with its place.
  Setting ReadIniSetting(const std::string& key, const std::string& defaultValue);
  Setting ReadChipSetting(const std::string& chipSection, const std::string& key, const std::string& defaultValue);

  /// For people: which of the layered files have a section of this system, in words.
  [[nodiscard]] std::string DescribeSections();

  /// The keys of a chip section with this beginning that were looked up and have no value, by commas.
  [[nodiscard]] std::string MissingKeys(const std::string& chipSection, const std::string& beginning);

  [[nodiscard]] bool HasChipSection(const std::string& chipSection);

  /// Writes the record of all look-ups to standard output.
  void DumpLookups();

  /// The record begins anew.
  void ForgetLookups();

  [[nodiscard]] bool IsChipIniPresent() { return GetSources().chipIniPresent; }
  [[nodiscard]] std::string GetChipIniPath() { return GetSources().chipIniPath; }

 private:
  struct Sources {
    std::string detectIniPath = ".\\mbdetect.ini";
    std::string section = "common";  // of this system: its id in upper-case hexadecimal
    std::string testIniPath = ".\\mbtest.ini";
    std::string chipIniPath = ".\\chip.ini";
    bool testIniPresent = false;
    bool chipIniPresent = false;
  };

  struct Result {
    status_t status = kNotFound;
    std::string text;
    std::string place;  // as Setting's
  };

  static Sources WithPresence(Sources from);
  Sources GetSources();
  IniFile GetChipFile(const std::string& path);
  static Result LookUp(const Sources& from, const std::string& key);
  Result LookUpChip(const std::string& chipSection, const std::string& key);
  static Result Judge(const std::string& raw, std::string place);
  void TellOfMissingBase(const IniFile& file, const std::string& from, const std::string& path,
                         const std::string& base) const;
  void Record(const std::string& entry, const std::string& value);
  std::string ReadText(const Result& result, const std::string& entry, const std::string& defaultValue);
  template <class Number>
  Number ReadNumber(const Result& result, const std::string& entry, Number defaultValue, unsigned bits);

  std::mutex guard;  // of all that follows; never held while a file is touched, which may wait
  std::optional<Sources> sources;
  std::map<std::string, std::string> lookups;
  std::optional<IniFile> chipFile;  // opened at the first chip look-up, kept from then on
};

// The same on IniReader::Instance(), for all of the board library.
std::string ReadIniValue(const std::string& key, const std::string& defaultValue);
std::string ReadIniValue(const std::string& key, IniReader::status_t& status, const std::string& defaultValue);
int ReadIniInt(const std::string& key, int defaultValue);
unsigned int ReadIniUnsigned(const std::string& key, unsigned int defaultValue);

// Numbers of 8 and 16 bits without sign: the low bits of what ReadIniUnsigned gives.
std::uint8_t ReadIniByte(const std::string& key, std::uint8_t defaultValue);
std::uint16_t ReadIniWord(const std::string& key, std::uint16_t defaultValue);

// The same with the default for a value of 0, too, as an address that is "undef".
std::uint16_t ReadIniWordUnlessZero(const std::string& key, std::uint16_t defaultValue);
std::uint32_t ReadIniUnsignedUnlessZero(const std::string& key, std::uint32_t defaultValue);

std::string ReadChipValue(const std::string& chipSection, const std::string& key, const std::string& defaultValue);
Setting ReadChipSetting(const std::string& chipSection, const std::string& key, const std::string& defaultValue);
int ReadChipInt(const std::string& chipSection, const std::string& key, int defaultValue);

// Numbers of 8, 16 and 32 bits without sign: the low bits of what ReadChipInt gives.
std::uint8_t ReadChipByte(const std::string& chipSection, const std::string& key, std::uint8_t defaultValue);
std::uint16_t ReadChipWord(const std::string& chipSection, const std::string& key, std::uint16_t defaultValue);
std::uint32_t ReadChipDword(const std::string& chipSection, const std::string& key, std::uint32_t defaultValue);

}  // namespace panelglow
