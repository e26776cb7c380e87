#include "board/base/Setting.h"

#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"

namespace panelglow {

namespace {

bool Fits(std::int64_t number, unsigned bits) {
  const std::int64_t beyond = std::int64_t{1} << bits;
  return number >= (bits == kIntBits ? -beyond : 0) && number < beyond;
}

}  // namespace

void TellOf(const Setting& setting, const std::string& what) {
  if (!setting.place.empty()) {
    Notices::Tell(setting.place + ": " + what + (what.ends_with('.') ? "" : "."));
  }
}

void CheckNumber(const std::string& token, unsigned bits, std::uint32_t counted, const Setting& setting) {
  if (setting.place.empty()) {
    return;
  }
  if (!CDMUtil::IsInteger(token)) {
    TellOf(setting, "\"" + token + "\" is no number and counts as 0; numbers are decimal, or hexadecimal behind 0x");
  } else if (!Fits(CDMUtil::ToInt64(token), bits)) {
    TellOf(setting, "\"" + token + "\" does not fit into " + CDMUtil::ToString(bits) + " bits and counts as 0x" +
                        CDMUtil::ToUpper(CDMUtil::ToHexString(static_cast<int>(counted))));
  }
}

std::uint32_t NumberIn(const std::string& token, unsigned bits, const Setting& setting) {
  const std::uint32_t number = static_cast<std::uint32_t>(CDMUtil::ToInt(token)) & ((1U << bits) - 1);
  CheckNumber(token, bits, number, setting);
  return number;
}

std::uint32_t WideNumberIn(const std::string& token, const Setting& setting) {
  const std::uint32_t number = CDMUtil::ToUnsignedLong(token);
  CheckNumber(token, 32, number, setting);
  return number;
}

}  // namespace panelglow
