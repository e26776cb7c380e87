#include "pages/ManPage.h"

#include <algorithm>
#include <cctype>
#include <sstream>
#include <vector>

namespace panelglow::pages {

namespace {

// Text as it stands: nothing in it is a request of the formatter. Hyphens are those that can be copied.
std::string Escaped(std::string_view text) {
  std::string escaped = !text.empty() && (text.front() == '.' || text.front() == '\'') ? "\\&" : "";
  for (const char c : text) {
    escaped += c == '\\' ? "\\e" : c == '-' ? "\\-" : std::string(1, c);
  }
  return escaped;
}

std::string Upper(std::string_view text) {
  std::string upper(text);
  std::transform(upper.begin(), upper.end(), upper.begin(),
                 [](char c) { return static_cast<char>(std::toupper(static_cast<unsigned char>(c))); });
  return upper;
}

std::string Head(std::string_view name, char section, std::string_view summary, const PageTexts& texts) {
  return ".TH " + Escaped(Upper(name)) + " " + section + " \"\" \"panelglow\\-diags " + texts.version +
         "\" \"panelglow\\-diags\"\n.nh\n.ad l\n.SH NAME\n" + Escaped(name) + " \\- " + Escaped(summary) + "\n";
}

std::string Paragraphs(std::string_view text) {
  std::string out;
  std::istringstream lines{std::string(text)};
  for (std::string line; std::getline(lines, line);) {
    const std::size_t first = std::min(line.find_first_not_of(' '), line.size());
    const std::size_t gap = line.find("  ", first);
    if (first > 0 && gap != std::string::npos) {  // a row of a list: a name, blanks, its meaning
      out += ".TP\n" + Escaped(line.substr(first, gap - first)) + "\n" +
             Escaped(line.substr(line.find_first_not_of(' ', gap))) + "\n";
    } else {
      out += line.empty() ? ".PP\n" : Escaped(line) + "\n";
    }
  }
  return out;
}

// "name=VALUE", "name VALUE" or only one of the two.
std::string FormOf(const Option& option, bool hasEqualsSigns) {
  std::string form;
  for (const std::string& name : option.names) {
    form += (form.empty() ? "\\fB" : ", \\fB") + Escaped(name) + "\\fR";
  }
  if (!option.value.empty()) {
    form += (form.empty() ? "" : hasEqualsSigns ? "=" : " ") + ("\\fI" + Escaped(option.value)) + "\\fR";
  }
  return form;
}

std::string Sentence(const std::string& text) {
  const bool hasEnd = !text.empty() && (text.back() == '.' || text.back() == ')');
  return Escaped(text) + (hasEnd ? "" : ".");
}

std::string OptionsOf(const Command& command, bool hasEqualsSigns, bool isVerb) {
  std::string out;
  for (const Option& option : command.options) {
    if (isVerb && !option.names.empty() && option.names.back() == "--help") {
      continue;  // as everywhere
    }
    out += ".TP\n" + FormOf(option, hasEqualsSigns) + "\n" + Sentence(option.meaning);
    if (option.values == Values::kChoices && option.value != "boolean") {
      std::string all;
      for (const std::string& choice : option.choices) {
        all += (all.empty() ? "" : ", ") + choice;
      }
      out += "\nOne of: " + Escaped(all) + ".";
    }
    out += option.isRequired && !option.names.empty() ? "\nRequired.\n" : "\n";
  }
  return out;
}

// The pieces between the bars of a table's row; a bar behind a backslash is none.
std::vector<std::string> Cells(std::string_view row) {
  std::vector<std::string> cells;
  std::string cell;
  for (std::size_t at = 1; at < row.size(); ++at) {
    if (row[at] == '|' && row[at - 1] != '\\') {
      const std::size_t first = std::min(cell.find_first_not_of(' '), cell.size());
      cells.push_back(cell.substr(first, cell.find_last_not_of(' ') + 1 - first));
      cell.clear();
    } else {
      cell += row[at];
    }
  }
  return cells;
}

// Without the marks of Markdown: `code`, **strong** and [text](place) are text.
std::string Unmarked(std::string_view text) {
  std::string plain;
  for (std::size_t at = 0; at < text.size(); ++at) {
    if (text[at] == '`' || text.substr(at, 2) == "**") {
      at += text[at] == '*' ? 1 : 0;
    } else if (text.substr(at, 2) == "](") {
      at = std::min(text.find(')', at), text.size() - 1);
    } else if (text[at] != '[' || text.find("](", at) == std::string_view::npos) {
      plain += text[at];
    }
  }
  return plain;
}

std::string RowOf(const std::vector<std::string>& cells) {
  if (cells.empty()) {
    return {};
  }
  std::string out = cells[0].empty() ? ".IP\n" : ".TP\n\\fB" + Escaped(Unmarked(cells[0])) + "\\fR\n";
  std::string rest;
  for (std::size_t i = 1; i < cells.size(); ++i) {
    if (!cells[i].empty()) {
      rest += (rest.empty() ? "" : "; ") + Unmarked(cells[i]);
    }
  }
  return out + Escaped(rest) + "\n";
}

}  // namespace

std::string ManPageOf(const Command& command, const PageTexts& texts) {
  const std::string summary = command.summary.substr(0, command.summary.find_first_of(".:\n"));
  std::string page = Head(command.name, '1', summary, texts);
  page += ".SH SYNOPSIS\n.B " + Escaped(command.name) + "\n";
  page += command.hasEqualsSigns  ? "\\fB\\-subtest\\fR=\\fIname\\fR [\\fB\\-name\\fR=\\fIvalue\\fR ...]\n"
          : command.verbs.empty() ? "[\\fIoptions\\fR]\n"
                                  : "\\fIverb\\fR [\\fIoptions\\fR]\n";
  for (const Option& option : command.options) {
    if (option.names.empty()) {
      page += "[\\fI" + Escaped(option.value) + "\\fR]\n";
    }
  }
  page += ".SH DESCRIPTION\n" + Paragraphs(command.summary + "\n\n" + texts.description);
  page += ".SH OPTIONS\n" + OptionsOf(command, command.hasEqualsSigns, false);
  if (!command.verbs.empty()) {
    page += command.hasEqualsSigns ? ".SH SUBTESTS\n" : ".SH VERBS\n";
    for (const Command& verb : command.verbs) {
      page += ".SS " + Escaped(verb.name) + "\n" + Sentence(verb.summary) + "\n" +
              OptionsOf(verb, command.hasEqualsSigns, true);
    }
  }
  page += ".SH EXIT STATUS\n";
  std::istringstream codes(texts.exitStatus);
  for (std::string line; std::getline(codes, line);) {
    page += ".TP\n" + line.substr(0, line.find(':')) + "\n" + Escaped(line.substr(line.find(':') + 2)) + "\n";
  }
  page += ".SH EXAMPLES\n.nf\n";
  std::istringstream examples(texts.examples);
  for (std::string line; std::getline(examples, line);) {
    page += Escaped(line) + "\n";
  }
  return page + ".fi\n.SH SEE ALSO\n" + Escaped(texts.seeAlso) + "\n";
}

std::string ManPageOfMarkdown(std::string_view name, std::string_view summary, std::string_view markdown,
                              const PageTexts& texts) {
  std::string page = Head(name, '5', summary, texts) + ".SH DESCRIPTION\n";
  std::istringstream lines{std::string(markdown)};
  bool isCode = false;
  int rowsOfTable = 0;  // its first two are the names of the columns
  for (std::string line; std::getline(lines, line);) {
    const bool isRow = !isCode && line.compare(0, 1, "|") == 0;
    rowsOfTable = isRow ? rowsOfTable + 1 : 0;
    if (line.compare(0, 3, "```") == 0) {
      isCode = !isCode;
      page += isCode ? ".PP\n.RS 4\n.nf\n" : ".fi\n.RE\n.PP\n";
    } else if (isCode) {
      page += line.empty() ? "\\&\n" : Escaped(line) + "\n";
    } else if (isRow) {
      page += rowsOfTable > 2 ? RowOf(Cells(line)) : "";
    } else if (line.compare(0, 2, "# ") == 0) {
      continue;  // the page has a title
    } else if (line.compare(0, 3, "## ") == 0) {
      page += ".SH " + Escaped(Upper(Unmarked(line.substr(3)))) + "\n";
    } else if (line.compare(0, 4, "### ") == 0) {
      page += ".SS " + Escaped(Unmarked(line.substr(4))) + "\n";
    } else if (line.compare(0, 2, "- ") == 0) {
      page += ".IP \\(bu 2\n" + Escaped(Unmarked(line.substr(2))) + "\n";
    } else {
      page += line.empty()
                  ? ".PP\n"
                  : Escaped(Unmarked(line.substr(std::min(line.find_first_not_of(' '), line.size())))) + "\n";
    }
  }
  return page + ".SH SEE ALSO\n" + Escaped(texts.seeAlso) + "\n";
}

}  // namespace panelglow::pages
