#include "boardtool/DialogChecks.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <map>
#include <memory>
#include <optional>
#include <set>

#include "boardtool/BoardLed.h"
#include "boardtool/ControllerChecks.h"
#include "boardtool/IniChecks.h"
#include "boardtool/Installation.h"
#include "boardtool/MessageChecks.h"
#include "boardtool/XmlTags.h"
#include "config/XmlObject.h"
#include "harness/base/CDMUtil.h"
#include "ledtests/LedKind.h"

namespace panelglow::boardtool {

namespace {

constexpr std::string_view kNoFunction = "none";
constexpr int kShortestPhase_ms = 60;
constexpr int kLongestPhase_ms = 5000;

// An element of a tree, with where it begins.
struct Placed {
  const XmlObject* element = nullptr;
  XmlTag tag;
  std::size_t depth = 0;

  [[nodiscard]] std::string Get(const char* attribute) const { return element->GetAttributeValue(attribute, ""); }
};

struct XmlFile {
  std::string path;
  XmlObject tree;
  std::vector<Placed> elements;  // in document order, the root first
};

class DialogCheck {
 public:
  DialogCheck(std::string folder, platform::Host& machine, const BoardKnowledge* boards,
              std::vector<IniOutline>& messages, Findings& findings)
      : folder_(std::move(folder)), machine_(machine), boards_(boards), messages_(messages), findings_(findings) {}

  void Run() {
    ReadMessages();
    const std::unique_ptr<XmlFile> definitions = Load("buttondefinition.xml", "buttondefinition.xsd");
    const std::unique_ptr<XmlFile> ui = Load("ui.xml", "ui.xsd");
    if (definitions) {
      CheckDefinitions(*definitions);
    }
    if (ui && definitions) {
      CheckUi(*ui, *definitions);
    }
  }

 private:
  void Add(std::string_view rule, const XmlFile& file, const Placed& element, const std::string& text) {
    findings_.Add(rule, file.path, element.tag.line, element.tag.column, text);
  }

  // ---- files

  void ReadMessages() {
    bool hasTexts = false;
    for (const char* const name : {"panelglow-diags.msg", "nonui_panelglow-diags.msg", "x_panelglow-diags.msg"}) {
      const std::string path = PathIn(folder_, name);
      const std::optional<std::string> bytes = ReadFile(path);
      if (!bytes) {
        if (std::string_view(name).front() != 'x') {
          findings_.Add("file-missing", path, 1, 1, "without it, numbers stand for texts");
        }
        continue;
      }
      if (!IsCheckableText(path, *bytes, true, findings_)) {
        continue;
      }
      messages_.emplace_back(path, *bytes);
      const IniOutline& file = messages_.back();
      CheckIniText(file, true, findings_);
      CheckMessages(file, std::string_view(name).front() != 'x', findings_);
      if (std::string_view(name).front() == 'p') {
        hasTexts = true;
        for (const IniSection& section : file.sections) {
          if (IsLanguage(section.name)) {
            languages_.push_back(section.name);
          }
        }
        texts_ = file;
      }
    }
    if (!hasTexts) {
      texts_.reset();
    }
  }

  std::unique_ptr<XmlFile> Load(const char* name, const char* schema) {
    const std::string path = PathIn(folder_, name);
    const std::optional<std::string> bytes = ReadFile(path);
    if (!bytes) {
      findings_.Add("file-missing", path, 1, 1, std::string(name) + " is missing or cannot be read");
      return nullptr;
    }
    if (bytes->size() > kLargestText_bytes) {
      findings_.Add("file-too-large", path, 1, 1, std::to_string(bytes->size()) + " bytes are too many for it");
      return nullptr;
    }
    const std::vector<XmlTag> tags = XmlTagsOf(*bytes);
    if (!IsValid(path, PathIn(folder_, schema), tags)) {
      return nullptr;
    }
    auto file = std::make_unique<XmlFile>();
    file->path = path;
    if (!file->tree.LoadFromFile(path, false, false, -1)) {
      findings_.Add("xml", path, 1, 1, "the file holds something that the program does not read");
      return nullptr;
    }
    std::size_t next = 0;
    Place(file->tree, tags, next, 0, file->elements);
    return file;
  }

  static void Place(const XmlObject& element, const std::vector<XmlTag>& tags, std::size_t& next, std::size_t depth,
                    std::vector<Placed>& placed) {
    placed.push_back({&element, next < tags.size() ? tags[next] : XmlTag{}, depth});
    ++next;
    for (const XmlObject& child : element.children) {
      Place(child, tags, next, depth + 1, placed);
    }
  }

  // Whether the file is XML that fits its schema; says what is not.
  bool IsValid(const std::string& path, const std::string& schema, const std::vector<XmlTag>& tags) {
    const std::unique_ptr<platform::XmlDocument> document = machine_.xmlDocuments.Create();
    if (!document) {
      throw CannotRun("the XML component is missing: libpanelglow-xml.so belongs beside the program");
    }
    platform::XmlProblem problem;
    if (!document->Load(path, problem)) {
      AddProblem("xml", path, problem, tags);
      return false;
    }
    if (!ReadFile(schema)) {
      findings_.Add("file-missing", schema, 1, 1,
                    "the schema of " + path + " is missing; every test refuses to start");
      return true;
    }
    document->SetRootAttribute("xmlns:xsi", "http://www.w3.org/2001/XMLSchema-instance");
    document->SetRootAttribute("xsi:noNamespaceSchemaLocation", schema);
    for (const platform::XmlProblem& one : document->Validate()) {
      AddProblem("schema", path, one, tags);
    }
    return true;
  }

  void AddProblem(std::string_view rule, const std::string& path, const platform::XmlProblem& problem,
                  const std::vector<XmlTag>& tags) {
    constexpr std::string_view kLine = "line ";
    const std::string reason = CDMUtil::Trim(problem.reason);
    std::size_t line = 0;
    const auto [end, error] = reason.starts_with(kLine)
                                  ? std::from_chars(reason.data() + kLine.size(), reason.data() + reason.size(), line)
                                  : std::from_chars_result{reason.data(), std::errc::invalid_argument};
    if (error == std::errc() && std::string_view(end, reason.data() + reason.size()).starts_with(": ")) {
      findings_.Add(rule, path, line, 1, std::string(end + 2, reason.data() + reason.size()));
      return;
    }
    const XmlTag* const tag = TagAt(tags, problem.location);
    findings_.Add(rule, path, tag == nullptr ? 1 : tag->line, tag == nullptr ? 1 : tag->column, reason);
  }

  // ---- definitions

  void CheckDefinitions(const XmlFile& file) {
    std::set<std::string> ids;
    for (const Placed& button : file.elements) {
      if (button.depth != 1 || button.element->name != "Button") {
        continue;
      }
      const std::string id = button.Get("ID");
      if (!ids.insert(id).second) {
        Add("duplicate-button", file, button,
            "the definition of \"" + id + "\" stands above already; that one counts");
      }
      if (id != CDMUtil::ToLower(id)) {
        Add("unknown-button", file, button, "\"" + id + "\" is found by no button: an ID stands here in lower case");
      }
      const std::string function = CDMUtil::ToLower(button.Get("Function"));
      const LedKind* const kind = FindLedKindByFunction(function);
      if (kind == nullptr && function != kNoFunction) {
        std::vector<std::string> known{std::string(kNoFunction)};
        for (const LedKind& one : LedKinds()) {
          known.emplace_back(one.function);
        }
        const std::string nearest = Nearest(function, known);
        Add("unknown-button", file, button,
            "\"" + id + "\" has the function \"" + function + "\", which no LED has" +
                (nearest.empty() ? "" : "; is \"" + nearest + "\" meant?"));
      } else if (kind != nullptr &&
                 static_cast<std::uint32_t>(CDMUtil::ToInt(button.Get("ButtonLParam"))) != kind->buttonCommand) {
        Add("unknown-button", file, button,
            "\"" + id + "\" has the command \"" + button.Get("ButtonLParam") + "\"; the answer to this LED is " +
                std::to_string(kind->buttonCommand));
      }
      CheckIcon(file, button);
      CheckCaption(file, button, button.Get("MessageID"));
    }
  }

  void CheckIcon(const XmlFile& file, const Placed& button) {
    constexpr std::array<std::string_view, 5> kPictures{std::string_view("\0\0\1\0", 4), "\x89PNG", "BM", "GIF8",
                                                        "\xFF\xD8\xFF"};
    const std::string name = button.Get("ButtonIco");
    const std::optional<std::string> bytes = name.empty() ? std::nullopt : ReadFile(PathIn(folder_, name));
    if (!bytes) {
      Add("icon-missing", file, button,
          "the icon \"" + name + "\" of \"" + button.Get("ID") + "\" is missing or cannot be read");
    } else if (std::none_of(kPictures.begin(), kPictures.end(),
                            [&](std::string_view mark) { return bytes->starts_with(mark); })) {
      Add("icon-missing", file, button, "the icon \"" + name + "\" of \"" + button.Get("ID") + "\" is no picture");
    }
  }

  void CheckCaption(const XmlFile& file, const Placed& button, const std::string& message) {
    if (!texts_) {
      return;
    }
    for (const std::string& language : languages_) {
      const IniEntry* const text = texts_->Find(language, message);
      if (text == nullptr || text->value.empty()) {
        Add("caption-missing", file, button,
            "the caption of \"" + button.Get("ID") + "\", text " + message + ", is not in [" + language + "] of " +
                texts_->path);
      }
    }
  }

  // ---- buttons of sections

  void CheckUi(const XmlFile& ui, const XmlFile& definitions) {
    std::map<std::string, const Placed*> byId;
    std::vector<std::string> ids;
    for (const Placed& button : definitions.elements) {
      if (button.depth == 1 && button.element->name == "Button" &&
          byId.try_emplace(button.Get("ID"), &button).second) {
        ids.push_back(button.Get("ID"));
      }
    }
    std::set<std::string> sections;
    std::set<std::string> inSection;
    std::string section;
    std::string function;  // of the last button
    for (const Placed& element : ui.elements) {
      if (element.depth == 1) {
        section = element.Get("ID");
        inSection.clear();
        if (element.element->name == "Section" && !sections.insert(section).second) {
          Add("duplicate-section", ui, element, "section \"" + section + "\" stands above already; that one counts");
        }
      } else if (element.depth == 2) {
        CheckButton(ui, element, section, inSection, byId, ids);
        const auto definition = byId.find(CDMUtil::ToLower(element.Get("ID")));
        function = definition == byId.end() ? "" : CDMUtil::ToLower(definition->second->Get("Function"));
      } else if (element.depth == 3 && element.element->name == "Config") {
        CheckPhases(ui, element);
        if (function == "hdgreen") {
          CheckControllerOf(ui, element);
        }
      }
    }
  }

  void CheckButton(const XmlFile& ui, const Placed& button, const std::string& section,
                   std::set<std::string>& inSection, const std::map<std::string, const Placed*>& byId,
                   const std::vector<std::string>& ids) {
    const std::string id = button.Get("ID");
    if (!inSection.insert(CDMUtil::ToLower(id)).second) {
      Add("duplicate-button", ui, button, "the button \"" + id + "\" stands twice in section \"" + section + "\"");
    }
    const auto definition = byId.find(CDMUtil::ToLower(id));
    if (definition == byId.end()) {
      const std::string nearest = Nearest(CDMUtil::ToLower(id), ids);
      Add("unknown-button", ui, button,
          "the button \"" + id + "\" is left out: buttondefinition.xml does not have it" +
              (nearest.empty() ? "" : "; is \"" + nearest + "\" meant?"));
      return;
    }
    const std::string active = button.Get("Active");
    constexpr std::array kTakenIn{"", "true", "yes", "1", "on"};
    if (active != "false" &&
        std::find(kTakenIn.begin(), kTakenIn.end(), CDMUtil::ToLower(active)) == kTakenIn.end()) {
      Add("yes-or-no", ui, button,
          "Active=\"" + active + "\" leaves the LED in the test: only \"false\" takes it out");
    }
    if (!button.Get("MessageID").empty()) {
      CheckCaption(ui, button, button.Get("MessageID"));
    }
    const std::string function = CDMUtil::ToLower(definition->second->Get("Function"));
    const std::span<const BoardLed> leds = BoardLeds();
    // The network LED is also that of an adapter's link, which no file tells.
    const bool isBoards = function != "network" && std::any_of(leds.begin(), leds.end(), [&](const BoardLed& led) {
                            return led.function == function;
                          });
    if (boards_ != nullptr && active != "false" && isBoards && !boards_->litFunctions.contains(function)) {
      Add("led-not-lit", ui, button,
          "section \"" + section + "\" asks for \"" + id + "\", and no board of the files lights such an LED");
    }
  }

  void CheckPhases(const XmlFile& ui, const Placed& config) {
    for (const char* const attribute : {"LEDOnTime", "LEDOffTime"}) {
      const std::string text = config.Get(attribute);
      if (text.empty()) {
        continue;
      }
      const int phase_ms = CDMUtil::ToInt(text);
      if (!CDMUtil::IsInteger(text)) {
        Add("not-a-number", ui, config, std::string(attribute) + "=\"" + text + "\" is no number and counts as 0");
      } else if (phase_ms > 0 && (phase_ms < kShortestPhase_ms || phase_ms > kLongestPhase_ms)) {
        Add("blink-rate", ui, config,
            std::string(attribute) + " of " + text + " ms is " +
                (phase_ms < kShortestPhase_ms ? "faster" : "slower") + " than an eye takes for blinking");
      }
    }
  }

  // A drive LED is that of the controllers that are named.
  void CheckControllerOf(const XmlFile& ui, const Placed& config) {
    const std::string selection = CDMUtil::ToLower(config.Get("Controller"));
    if (selection.empty() || selection == "all" || selection == "any") {
      return;
    }
    const std::string path = PathIn(folder_, "msctrl.ini");
    const std::vector<std::string> known = ControllerNamesIn(IniOutline(path, ReadFile(path).value_or("")));
    std::vector<std::string> names;
    CDMUtil::Split(selection, names, ",");
    for (const std::string& name : names) {
      if (std::find(known.begin(), known.end(), name) == known.end()) {
        const std::string nearest = Nearest(name, known);
        Add("unknown-controller", ui, config,
            path + " has no controller \"" + name + "\"" +
                (nearest.empty() ? "" : "; is \"" + nearest + "\" meant?"));
      }
    }
  }

  std::string folder_;
  platform::Host& machine_;
  const BoardKnowledge* boards_;
  std::vector<IniOutline>& messages_;
  Findings& findings_;
  std::optional<IniOutline> texts_;
  std::vector<std::string> languages_;
};

}  // namespace

void CheckDialog(const std::string& folder, platform::Host& machine, const BoardKnowledge* boards,
                 std::vector<IniOutline>& messages, Findings& findings) {
  DialogCheck(folder, machine, boards, messages, findings).Run();
}

}  // namespace panelglow::boardtool
