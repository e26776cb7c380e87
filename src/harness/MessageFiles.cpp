#include "harness/MessageFiles.h"

#include <algorithm>
#include <array>
#include <utility>

#include "harness/CmdLineParser.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/MessageFormat.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr const char* kDefaultLocale = "en_US";
constexpr const char16_t* kMediaSection = u"all multimedia";
constexpr std::size_t kMediaBuffer = 255;

// The program's name as message files carry it: without folder, cut off at ".exe".
std::string BaseNameOf(const std::string& programPath) {
  const std::string file = platform::TheHost().files.FileName(programPath);
  return file.substr(0, file.find(".exe"));
}

// In the current folder; by that name when its path is too long for CurrentDirectoryPath.
std::string MessageFilePath(const std::string& prefix, const std::string& programPath) {
  const std::string folder = CDMUtil::CurrentDirectoryPath();
  return (folder.empty() ? "." : folder) + "\\" + prefix + BaseNameOf(programPath) + ".msg";
}

// A number stands where the text should be.
void TellIfMissing(bool exists, const std::string& path) {
  if (!exists) {
    std::string shown = path;
    if (shown.find('/') != std::string::npos) {
      std::replace(shown.begin(), shown.end(), '\\', '/');  // our last separator in a folder of another spelling
    }
    Notices::Tell(
        "The message file " + shown +
        " is missing, so that numbers stand for texts: start the program in the folder of the installation.");
  }
}

wstring WideIdOf(int id) { return CDMUtil::ToWString(CDMUtil::ToString(id)); }

}  // namespace

MessageFiles& MessageFiles::Instance() {
  static MessageFiles files = OfCommandLine();
  return files;
}

MessageFiles MessageFiles::OfCommandLine() {
  const CmdLineParser& parser = CmdLineParser::GetInstance();
  return {parser.GetProgramPath(), parser.GetParameter("-integratormsgfile", ""),
          parser.GetParameter("-locale", kDefaultLocale)};
}

MessageFiles::MessageFiles(const std::string& programPath, const std::string& integratorFile, std::string localeName)
    : locale(std::move(localeName)),
      logTexts(MessageFilePath("nonui_", programPath)),
      integratorTexts(platform::WideFromUtf8(integratorFile)),
      customTexts(platform::WideFromUtf8(MessageFilePath("x_", programPath))),
      standardTexts(platform::WideFromUtf8(MessageFilePath("", programPath))) {}

std::string MessageFiles::ResolveLogMessage(unsigned int id, const std::string& text) const {
  const std::string number = CDMUtil::ToString(id);
  const std::string format = (*logTexts).GetValue(locale, number);
  if (!format.empty()) {
    return FormatMessageText(format, text);
  }
  TellIfMissing((*logTexts).Exists(), (*logTexts).GetPath());
  return number + " \"" + text + "\"";
}

wstring MessageFiles::GetResourceString(int id, const wstring& text) const {
  const wstring key = WideIdOf(id);
  for (const WideTexts* file : {&integratorTexts, &customTexts, &standardTexts}) {
    const wstring format = (**file).GetValue(CDMUtil::ToWString(locale), key);
    if (!format.empty()) {
      return FormatMessageText(format, text);
    }
  }
  TellIfMissing((*standardTexts).Exists(), platform::Utf8FromWide((*standardTexts).GetPath()));
  return key + u" \"" + text + u"\"";
}

// A picture that exists; the key itself for an entry whose file does not exist; empty when there is no entry.
wstring MessageFiles::LookUpMedia(const WIniFile& file, const wstring& key) const {
  std::array<char16_t, kMediaBuffer> buffer{};
  platform::TheHost().profiles.GetValue(kMediaSection, key, key, buffer, file.GetPath());
  wstring value = buffer.data();
  if (!value.empty() && CDMUtil::FileExists(platform::Utf8FromWide(value))) {
    return value;
  }
  return value == key ? wstring() : key;
}

wstring MessageFiles::GetResourceString(int id, const wstring& text, const wstring& fallback,
                                        wstring& mediaPath) const {
  const wstring key = WideIdOf(id);
  wstring format;
  for (const WideTexts* texts : {&integratorTexts, &customTexts, &standardTexts}) {
    const WIniFile& file = **texts;
    if (!file.Exists()) {
      continue;
    }
    if (texts == &integratorTexts || mediaPath.empty()) {
      mediaPath = LookUpMedia(file, key);
    }
    if (format.empty()) {
      format = file.GetValue(CDMUtil::ToWString(locale), key);
    }
    if (!format.empty() && !mediaPath.empty()) {
      break;
    }
  }
  if (!format.empty()) {
    return FormatMessageText(format, text);
  }
  TellIfMissing((*standardTexts).Exists(), platform::Utf8FromWide((*standardTexts).GetPath()));
  return fallback;
}

}  // namespace panelglow
