#include "platform/sim/SimFiles.h"

#include <algorithm>
#include <cctype>

namespace panelglow::platform::sim {

namespace {
constexpr Microseconds kFileCost_us = 50;

// The simulated program goes by its product's name, so that it finds the product's message files.
constexpr std::string_view kSimulatedProgram = "panelglow-diags-sim";
constexpr std::string_view kProduct = "panelglow-diags";
}  // namespace

std::string SimFiles::Key(std::string_view path) {
  std::string key(path);
  std::replace(key.begin(), key.end(), '/', '\\');
  while (key.starts_with(".\\")) {
    key.erase(0, 2);
  }
  return key;
}

bool SimFiles::IsVirtual(const std::string& key) const {
  const bool drive = key.size() > 1 && key[1] == ':' && std::isalpha(static_cast<unsigned char>(key[0])) != 0;
  return real_ == nullptr || drive || overlay_.count(key) != 0;
}

std::optional<std::string> SimFiles::Read(std::string_view path) {
  scheduler_.Spend(kFileCost_us);
  const std::string key = Key(path);
  const auto found = overlay_.find(key);
  if (found != overlay_.end()) {
    return found->second;
  }
  // A path of the program's own form "\name" means the simulated drive's root; '/' paths are the real system's.
  if (IsVirtual(key) || path.starts_with('\\')) {
    return std::nullopt;
  }
  return real_->Read(path);
}

std::optional<std::string> SimFiles::ReadLocked(std::string_view path) {
  const std::string key = Key(path);
  if (IsVirtual(key) || path.starts_with('\\')) {
    return Read(path);
  }
  scheduler_.Spend(kFileCost_us);
  return real_->ReadLocked(path);
}

bool SimFiles::CanRead(std::string_view path) {
  if (path.empty()) {
    return false;
  }
  const std::string key = Key(path);
  if (IsVirtual(key) || path.starts_with('\\')) {
    return Read(path).has_value();
  }
  scheduler_.Spend(kFileCost_us);
  return real_->CanRead(path);
}

bool SimFiles::Write(std::string_view path, std::string_view bytes) {
  scheduler_.Spend(kFileCost_us);
  if (full_ || path.empty()) {
    return false;
  }
  const std::string key = Key(path);
  if (IsVirtual(key) || path.starts_with('\\')) {
    overlay_[key] = std::string(bytes);
    return true;
  }
  return real_->Write(path, bytes);
}

bool SimFiles::WriteLocked(std::string_view path, std::string_view bytes) {
  const std::string key = Key(path);
  if (full_ || IsVirtual(key) || path.starts_with('\\')) {
    return Write(path, bytes);
  }
  scheduler_.Spend(kFileCost_us);
  return real_->WriteLocked(path, bytes);
}

bool SimFiles::Remove(std::string_view path) {
  scheduler_.Spend(kFileCost_us);
  const std::string key = Key(path);
  if (IsVirtual(key) || path.starts_with('\\')) {
    const bool existed = overlay_.count(key) != 0 && overlay_[key].has_value();
    overlay_[key] = std::nullopt;
    return existed;
  }
  return real_->Remove(path);
}

std::string SimFiles::FullPath(std::string_view path) {
  return real_ != nullptr ? real_->FullPath(path) : CurrentDirectory() + "\\" + Key(path);
}

std::string SimFiles::CurrentDirectory() { return real_ != nullptr ? real_->CurrentDirectory() : "C:\\bench"; }

std::string SimFiles::FileName(std::string_view path) {
  const std::size_t separator = path.find_last_of("\\/");
  const std::string_view name = separator == std::string_view::npos ? path : path.substr(separator + 1);
  return std::string(name == kSimulatedProgram ? kProduct : name);
}

std::string SimFiles::ExecutablePath() {
  return real_ != nullptr ? real_->ExecutablePath() : "C:\\bench\\panelglow-diags.exe";
}

}  // namespace panelglow::platform::sim
