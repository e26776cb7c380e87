// The profile services over the files of any backend. Nothing is cached: each call reads the file anew.
#pragma once

#include <functional>
#include <string>

#include "platform/Files.h"
#include "platform/ProfileFiles.h"

namespace panelglow::platform::profile {

class ProfileFilesOnFiles : public ProfileFiles {
 public:
  explicit ProfileFilesOnFiles(Files& files) : files_(files) {}

  std::size_t GetValue(std::optional<std::string_view> section, std::optional<std::string_view> key,
                       std::string_view fallback, std::span<char> buffer, std::string_view path) override;
  std::size_t GetValue(std::optional<std::u16string_view> section, std::optional<std::u16string_view> key,
                       std::u16string_view fallback, std::span<char16_t> buffer, std::u16string_view path) override;
  std::size_t GetSection(std::string_view section, std::span<char> buffer, std::string_view path) override;
  bool SetValue(std::string_view section, std::optional<std::string_view> key, std::optional<std::string_view> value,
                std::string_view path) override;
  bool SetValue(std::u16string_view section, std::optional<std::u16string_view> key,
                std::optional<std::u16string_view> value, std::u16string_view path) override;
  bool SetValues(std::string_view section, std::span<const ProfileEntry> entries, std::string_view path) override;

 private:
  bool Edit(std::string_view path, const std::function<std::string(const std::string&)>& edit);

  Files& files_;
};

}  // namespace panelglow::platform::profile
