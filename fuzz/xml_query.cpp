// The language of paths and filters, on a small tree: a line with the path, the rest is the filter.
#include <algorithm>
#include <stdexcept>

#include "FuzzTarget.h"
#include "config/XmlObject.h"

namespace panelglow::fuzz {
namespace {

constexpr const char* kTree =
    "<a i='1' j=''><b i='2'>text</b><b/><c><property name='n' caption='c' value='v'/>more<d k='&lt;'/></c></a>";

// Each step up and down again doubles the elements where there are two of a name.
constexpr std::ptrdiff_t kMostSteps = 12;

void Run(std::string_view bytes) {
  XmlObject tree(kTree);
  const std::string path = Take(bytes, '\n');
  if (std::count(path.begin(), path.end(), '/') > kMostSteps) {
    return;
  }
  const std::string filter(bytes);
  try {
    const std::size_t found = tree.FindAll(path, filter).size();
    Check((tree.FindFirstMatch(path, filter) != nullptr) == (found > 0), "the first match is one of all");
    Check(tree.FindAll(".", filter).size() == (tree.Matches(filter) ? 1U : 0U), "a tree that matches finds itself");
    Check(tree.GetValue(path + "/none", filter) == filter, "what does not exist is the default");
  } catch (const std::runtime_error&) {
  }
}

const Registered kTarget("xml_query", Run);

}  // namespace
}  // namespace panelglow::fuzz
