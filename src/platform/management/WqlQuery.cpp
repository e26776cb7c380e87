#include "platform/management/WqlQuery.h"

#include <cctype>
#include <type_traits>
#include <variant>

#include "platform/AsciiCase.h"
#include "platform/Text.h"

namespace panelglow::platform::management {

namespace {

class Words {
 public:
  explicit Words(std::string_view text) : rest_(text) { Skip(); }

  [[nodiscard]] bool IsAtEnd() const { return rest_.empty(); }

  bool Take(char sign) {
    if (rest_.empty() || rest_.front() != sign) {
      return false;
    }
    rest_.remove_prefix(1);
    Skip();
    return true;
  }

  /// Takes the word if it is this one.
  bool Take(std::string_view word) {
    const std::string_view before = rest_;
    if (EqualNames(Name(), word)) {
      return true;
    }
    rest_ = before;
    return false;
  }

  /// Letters, digits and underscores; empty when something else stands here.
  std::string Name() {
    std::size_t length = 0;
    while (length < rest_.size() &&
           (std::isalnum(static_cast<unsigned char>(rest_[length])) != 0 || rest_[length] == '_')) {
      ++length;
    }
    std::string name(rest_.substr(0, length));
    rest_.remove_prefix(length);
    Skip();
    return name;
  }

  /// A name or number, or a text in quotes of either kind, in which a backslash stands ahead of itself and of quotes.
  std::optional<std::string> Value() {
    if (rest_.empty() || (rest_.front() != '\'' && rest_.front() != '"')) {
      std::string bare = Name();
      return bare.empty() ? std::nullopt : std::optional<std::string>(std::move(bare));
    }
    const char quote = rest_.front();
    std::string value;
    for (std::size_t i = 1; i < rest_.size(); ++i) {
      if (rest_[i] == quote) {
        rest_.remove_prefix(i + 1);
        Skip();
        return value;
      }
      i += rest_[i] == '\\' ? 1 : 0;
      if (i < rest_.size()) {
        value += rest_[i];
      }
    }
    return std::nullopt;
  }

 private:
  void Skip() {
    while (!rest_.empty() && std::isspace(static_cast<unsigned char>(rest_.front())) != 0) {
      rest_.remove_prefix(1);
    }
  }

  std::string_view rest_;
};

std::optional<WqlCondition> ParseCondition(Words& words) {
  WqlCondition condition;
  condition.property = words.Name();
  if (condition.property.empty() || !words.Take('=')) {
    return std::nullopt;
  }
  std::optional<std::string> value = words.Value();
  if (!value) {
    return std::nullopt;
  }
  condition.value = std::move(*value);
  return condition;
}

bool ParseSelect(Words& words, WqlQuery& query) {
  do {
    if (!words.Take('*') && words.Name().empty()) {
      return false;
    }
  } while (words.Take(','));
  if (!words.Take("from")) {
    return false;
  }
  query.className = words.Name();
  if (words.Take("where")) {
    query.condition = ParseCondition(words);
    return query.condition.has_value();
  }
  return true;
}

bool ParseAssociators(Words& words, WqlQuery& query) {
  if (!words.Take("of") || !words.Take('{')) {
    return false;
  }
  query.className = words.Name();
  if (!words.Take('.')) {
    return false;
  }
  query.condition = ParseCondition(words);
  if (!query.condition || !words.Take('}') || !words.Take("where") || !words.Take("resultclass") ||
      !words.Take('=')) {
    return false;
  }
  query.resultClass = words.Name();
  return !query.resultClass.empty();
}

// A value as a condition compares it; nothing for a null and for a list.
std::optional<std::string> TextOf(const ManagementValue* value) {
  const ManagementScalar* scalar = value == nullptr ? nullptr : std::get_if<ManagementScalar>(&value->content);
  if (scalar == nullptr) {
    return std::nullopt;
  }
  return std::visit(
      [](const auto& content) -> std::optional<std::string> {
        using Content = std::decay_t<decltype(content)>;
        if constexpr (std::is_same_v<Content, std::monostate>) {
          return std::nullopt;
        } else if constexpr (std::is_same_v<Content, wstring>) {
          return Utf8FromWide(content);
        } else if constexpr (std::is_same_v<Content, bool>) {
          return content ? "true" : "false";
        } else {
          return std::to_string(content);
        }
      },
      *scalar);
}

}  // namespace

std::optional<WqlQuery> ParseWql(std::string_view text) {
  Words words(text);
  WqlQuery query;
  const bool isRead = words.Take("select")        ? ParseSelect(words, query)
                      : words.Take("associators") ? ParseAssociators(words, query)
                                                  : false;
  return isRead && !query.className.empty() && words.IsAtEnd() ? std::optional<WqlQuery>(std::move(query))
                                                               : std::nullopt;
}

bool Fulfils(const ManagementRow& row, const WqlCondition& condition) {
  const std::optional<std::string> value = TextOf(row.Find(WideFromUtf8(condition.property)));
  return value && EqualNames(*value, condition.value);
}

}  // namespace panelglow::platform::management
