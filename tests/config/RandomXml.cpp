#include "config/RandomXml.h"

#include <array>

namespace panelglow {

namespace {

using namespace std::string_view_literals;

// What the parser knows, in whole and in part, and bytes that it does not take.
constexpr std::array kPieces{
    "<"sv,     ">"sv,    "/"sv,      "</"sv,   "/>"sv,    "="sv,      "'"sv,      "\""sv,      "!"sv,
    "-"sv,     "--"sv,   "<!--"sv,   "-->"sv,  "<!-"sv,   "<?"sv,     "?>"sv,     "?"sv,       "<?xml "sv,
    "&"sv,     ";"sv,    "&lt;"sv,   "&gt;"sv, "&amp;"sv, "&quot;"sv, "&apos;"sv, "&#09;"sv,   "&#10;"sv,
    "&#13;"sv, "&am"sv,  "&#x41;"sv, " "sv,    "\n"sv,    "\t"sv,     "\r"sv,     "\0"sv,      "\x01"sv,
    "\x1F"sv,  "\x7F"sv, "\x80"sv,   "\xFE"sv, "\xFF"sv,  "a"sv,      "B"sv,      "1"sv,       "_"sv,
    "<a"sv,    "<b>"sv,  "</a>"sv,   "<c/>"sv, " a='"sv,  "xml"sv,    "name"sv,   " d=\"x\""sv};

constexpr std::array kNames{"a"sv,
                            "b"sv,
                            "name"sv,
                            "NAME"sv,
                            "value"sv,
                            "Argument"sv,
                            "x-y.z:1"sv,
                            "xml"sv,
                            "fifteen-letters"sv,
                            "sixteen-letters-"sv,
                            "a-name-of-more-than-sixteen-letters"sv};

constexpr std::array kWords{"1"sv,
                            "text"sv,
                            "x &amp; y"sv,
                            "&lt;"sv,
                            " "sv,
                            "\n  "sv,
                            "caf\xC3\xA9"sv,
                            "a - b -- c"sv,
                            "exactly fifteen"sv,
                            "exactly sixteen."sv,
                            "a text of more than sixteen bytes &#10;&amp"sv};

// What the program reads, in small.
constexpr std::array kSamples{
    R"(<?xml version="1.0" encoding="UTF-8"?>
<!-- Which buttons there are. -- See below; Active="false" is shown only. -->
<UI>
  <Section ID="Default">
    <Button ID="NumLock"/>
    <Button ID="PowerGreen" Active="false" ErrorCode="771234"/>
  </Section>
</UI>
)"sv,
    R"(<ButtonDefinitions>
  <Button ID="numlock"     Function="numlock"      ButtonIco="spr_num.ico"    ButtonLParam="1003" MessageID="28"/>
  <Button ID="scrolllock"  Function="scrolllock"   ButtonIco="spr_scr.ico"    ErrorCode='771009'></Button>
</ButtonDefinitions>)"sv,
    R"(<DiagnosticsData Version="4.15.0">
  <Diagnostic name="diags"><?note kept?>
    <Subtest name="CustomLEDTest" duration="27450" status="1" errorcode="0" starttime="03/01/2024 12:00:00">
      <Failure number="0">It &lt;failed&gt; &amp; ended</Failure>
      <Argument name="-argument1" value=".\value &amp; text"/>
    </Subtest>
  </Diagnostic>
</DiagnosticsData>
)"sv,
    "<a 1b='x' _c='y' @k='v' $p='&quot;'><b/>text<!-- <!-- n --> -->more</a> <second/> <?pi?> <third x='1' X='2'/>"sv};

}  // namespace

std::string RandomXml::Text() {
  const std::size_t kind = Below(200);
  if (kind < 1) {
    return Large();
  }
  if (kind < 2) {
    return Deep();
  }
  if (kind < 60) {
    return Soup(30);
  }
  std::string text(kind < 100 ? kSamples[Below(kSamples.size())] : std::string_view());
  if (text.empty()) {
    text = Element(4);
  }
  if (kind % 4 != 0) {
    Damage(text, 4);
  }
  return text;
}

void RandomXml::Damage(std::string& text, std::size_t mostPlaces) {
  for (std::size_t places = 1 + Below(mostPlaces); places > 0 && !text.empty(); --places) {
    const std::size_t at = Below(text.size());
    const std::size_t length = 1 + Below(Below(4) == 0 ? 60 : 3);
    switch (Below(6)) {
      case 0:
        text.erase(at, length);
        break;
      case 1:
        text.insert(at, text.substr(at, length));
        break;
      case 2:
        text[at] = static_cast<char>(Below(256));
        break;
      case 3:
        text.replace(at, length, kPieces[Below(kPieces.size())]);
        break;
      case 4:
        text.resize(at);
        break;
      default:
        text.insert(at, kPieces[Below(kPieces.size())]);
        break;
    }
  }
}

std::string RandomXml::Element(int levels) {
  const std::string name(kNames[Below(kNames.size())]);
  std::string text = Below(20) == 0 ? "<?pi " + Soup(1) + "?>" : "";
  text += "<" + name;
  for (std::size_t attributes = Below(5); attributes > 0; --attributes) {
    text += Attribute();
  }
  if (Below(4) == 0) {
    return text + "/>";
  }
  text += ">" + Content();
  for (std::size_t children = levels > 0 ? Below(4) : 0; children > 0; --children) {
    text += Element(levels - 1);
    text += Content();
  }
  return text + "</" + name + ">";
}

std::string RandomXml::Attribute() {
  constexpr std::array kEquals{"="sv, "="sv, "="sv, "="sv, " = "sv, "<!-- -->="sv, "=\n"sv};
  std::string text = Below(10) == 0 ? " \n\t" : " ";
  text += kNames[Below(kNames.size())];
  text += kEquals[Below(kEquals.size())];
  const std::string quote = Below(2) == 0 ? "'" : "\"";
  text += quote;
  text += kWords[Below(kWords.size())];
  if (Below(8) == 0) {
    text += Soup(2);
  }
  return text + quote;
}

std::string RandomXml::Content() {
  const std::size_t kind = Below(8);
  if (kind < 4) {
    return kind == 0 ? "\n  " : "";
  }
  std::string text(kWords[Below(kWords.size())]);
  if (kind == 4) {
    text += "<!-- " + Soup(2) + " -->";
  }
  return text;
}

std::string RandomXml::Soup(std::size_t mostPieces) {
  std::string text;
  for (std::size_t pieces = Below(mostPieces + 1); pieces > 0; --pieces) {
    text += kPieces[Below(kPieces.size())];
  }
  return text;
}

// Long values, tags with many attributes, elements with many children.
std::string RandomXml::Large() {
  std::string text = "<root";
  if (Below(2) == 0) {
    text += " long='" + std::string(Below(100'000), 'x') + "&lt;" + std::string(Below(10), '-') + "'";
  }
  const std::size_t names = 1 + Below(80);
  for (std::size_t attributes = Below(80); attributes > 0; --attributes) {
    text +=
        (attributes % 2 == 0 ? " n" : " N") + std::to_string(Below(names)) + "='" + std::to_string(attributes) + "'";
  }
  text += ">" + std::string(Below(3) == 0 ? Below(60'000) : 0, 'y');
  const std::string child = Element(2);
  for (std::size_t children = Below(700); children > 0; --children) {
    text += child;
    text += "<c n='" + std::to_string(children) + "' value='.\\value &amp; text'/>\n";
  }
  text += "</root>";
  if (Below(3) == 0) {
    Damage(text, 2);
  }
  return text;
}

// About as deep as is allowed.
std::string RandomXml::Deep() {
  std::string text;
  const std::size_t levels = Below(4) == 0 ? 995 + Below(10) : Below(100);
  for (std::size_t level = 0; level < levels; ++level) {
    text += level % 7 == 0 ? "<b n='1'>t" : "<a>";
  }
  for (std::size_t level = 0; level < levels; ++level) {
    text += "</a>";
  }
  return text;
}

}  // namespace panelglow
