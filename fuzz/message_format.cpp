// Message texts as formats: a line with the argument, the rest is the format.
#include "FuzzTarget.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/MessageFormat.h"

namespace panelglow::fuzz {
namespace {

void Run(std::string_view bytes) {
  const std::string argument = Take(bytes, '\n');
  const std::string narrow = FormatMessageText(bytes, argument);
  const wstring wide = FormatMessageText(CDMUtil::ToWString(bytes), CDMUtil::ToWString(argument));
  Check(narrow.size() <= kLongestMessage, "a message has its longest size");
  Check(CDMUtil::ToWString(narrow) == wide, "both widths of a text are formatted the same");
}

const Registered kTarget("message_format", Run);

}  // namespace
}  // namespace panelglow::fuzz
