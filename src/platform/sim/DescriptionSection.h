// A table of a machine's file, and how values are taken out of it.
#pragma once

#include <toml++/toml.h>

#include <array>
#include <charconv>
#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <sstream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

/// Knows which of its keys were asked for, so that a misspelt key is an error and not silence. Every problem throws
/// MachineError with file and line.
class Section {
 public:
  Section(const toml::table& table, std::string_view source, std::string path)
      : table_(table), source_(source), path_(std::move(path)) {}

  [[noreturn]] void Fail(const toml::node& at, const std::string& problem) const {
    std::ostringstream text;
    text << source_ << ":" << at.source().begin.line << ": " << problem;
    throw MachineError(text.str());
  }

  template <class T>
  T Get(std::string_view key, T fallback) {
    const toml::node* node = Node(key);
    if (node == nullptr) {
      return fallback;
    }
    const std::optional<T> value = node->value<T>();
    if (!value) {
      Fail(*node, "\"" + path_ + std::string(key) + "\" has the wrong type or is out of range");
    }
    return *value;
  }

  [[noreturn]] void Refuse(std::string_view key, const std::string& rule) {
    Fail(*Node(key), "\"" + path_ + std::string(key) + "\" " + rule);
  }

  /// A number that has to be there.
  template <class T>
  T Number(std::string_view key) {
    if (Node(key) == nullptr) {
      Fail(table_, "\"" + path_ + std::string(key) + "\" is missing");
    }
    return Get<T>(key, {});
  }

  std::string Required(std::string_view key) {
    if (Node(key) == nullptr) {
      Fail(table_, "\"" + path_ + std::string(key) + "\" is missing");
    }
    return Get<std::string>(key, {});
  }

  std::vector<std::uint8_t> Bytes(std::string_view key) { return Numbers<std::uint8_t>(key); }

  template <class Number>
  std::vector<Number> Numbers(std::string_view key) {
    std::vector<Number> numbers;
    if (const toml::node* node = Node(key)) {
      const toml::array* array = node->as_array();
      if (array == nullptr) {
        Fail(*node, "\"" + path_ + std::string(key) + "\" must be a list of numbers");
      }
      for (const toml::node& element : *array) {
        const std::optional<Number> number = element.value<Number>();
        if (!number) {
          Fail(element, "\"" + path_ + std::string(key) + "\" holds a value that is no number of " +
                            std::to_string(8 * sizeof(Number)) + " bits");
        }
        numbers.push_back(*number);
      }
    }
    return numbers;
  }

  /// Calls `use` with each table of a list of tables, or with the one table under `key`.
  template <class Use>
  void Each(std::string_view key, Use use) {
    const toml::node* node = Node(key);
    if (node == nullptr) {
      return;
    }
    if (const toml::table* single = node->as_table()) {
      Open(*single, key, use);
      return;
    }
    const toml::array* array = node->as_array();
    if (array == nullptr) {
      Fail(*node, "\"" + path_ + std::string(key) + "\" must be a table");
    }
    for (const toml::node& element : *array) {
      const toml::table* entry = element.as_table();
      if (entry == nullptr) {
        Fail(element, "\"" + path_ + std::string(key) + "\" must hold tables");
      }
      Open(*entry, key, use);
    }
  }

  [[nodiscard]] bool Has(std::string_view key) const { return table_.get(key) != nullptr; }

  std::vector<std::string> Names(std::string_view key) {
    std::vector<std::string> names;
    if (const toml::node* node = Node(key)) {
      const toml::array* array = node->as_array();
      if (array == nullptr) {
        Fail(*node, "\"" + path_ + std::string(key) + "\" must be a list of names");
      }
      for (const toml::node& element : *array) {
        const std::optional<std::string> name = element.value<std::string>();
        if (!name) {
          Fail(element, "\"" + path_ + std::string(key) + "\" holds a value that is no name");
        }
        names.push_back(*name);
      }
    }
    return names;
  }

  /// The place of a text among `names`; the first when the key is missing.
  template <std::size_t Count>
  std::size_t OneOf(std::string_view key, const std::array<std::string_view, Count>& names) {
    const std::string text = Get<std::string>(key, std::string(names[0]));
    std::string all;
    for (std::size_t i = 0; i < names.size(); ++i) {
      if (text == names[i]) {
        return i;
      }
      all += (all.empty() ? "\"" : ", \"") + std::string(names[i]) + "\"";
    }
    Refuse(key, "must be one of " + all);
  }

  /// The table under `key`: hexadecimal addresses without 0x, each with a number.
  template <class Address, class Number>
  std::map<Address, Number> Addressed(std::string_view key) {
    std::map<Address, Number> numbers;
    Each(key, [&](Section& section) {
      for (const auto& [name, node] : section.Raw()) {
        Address address = 0;
        const std::string_view digits = name.str();
        const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), address, 16);
        const std::optional<Number> value = node.template value<Number>();
        if (error != std::errc() || end != digits.data() + digits.size() || !value) {
          section.Fail(node, "\"" + path_ + std::string(key) + "\" holds hexadecimal addresses with one number of " +
                                 std::to_string(8 * sizeof(Number)) + " bits each");
        }
        numbers[address] = *value;
      }
    });
    return numbers;
  }

  template <class Address>
  std::map<Address, std::uint8_t> AddressedBytes(std::string_view key) {
    return Addressed<Address, std::uint8_t>(key);
  }

  [[nodiscard]] const toml::table& Raw() {
    for (const auto& [key, node] : table_) {
      used_.emplace(key.str());
    }
    return table_;
  }

  void RefuseUnknownKeys() const {
    for (const auto& [key, node] : table_) {
      if (used_.find(key.str()) == used_.end()) {
        Fail(node, "\"" + path_ + std::string(key.str()) + "\" is not a key of a machine's file");
      }
    }
  }

 private:
  const toml::node* Node(std::string_view key) {
    used_.emplace(key);
    return table_.get(key);
  }

  template <class Use>
  void Open(const toml::table& entry, std::string_view key, Use use) {
    Section section(entry, source_, path_ + std::string(key) + ".");
    use(section);
    section.RefuseUnknownKeys();
  }

  const toml::table& table_;
  std::string source_;
  std::string path_;
  std::set<std::string, std::less<>> used_;
};

}  // namespace panelglow::platform::sim
