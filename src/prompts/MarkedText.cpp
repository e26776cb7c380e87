#include "prompts/MarkedText.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr platform::Color kGreen = 0x0000FF00;
constexpr platform::Color kRed = 0x000000FF;
constexpr int kMargin = 11;      // pixels from the pane's left, top and right
constexpr int kLineHeight = 16;  // pixels
constexpr int kNoBreak = 32767;  // pixels: a width that breaks no line
constexpr char16_t kFirstWideText = 0x80;

// Where a mark is in the text from a place on: upper-cased, or else as given.
struct Span {
  std::size_t begin;
  std::size_t end;
};
std::optional<Span> FindMark(const wstring& text, const wstring& mark, std::size_t from) {
  for (const wstring& form : {CDMUtil::ToUpper(mark), mark}) {
    if (const std::size_t at = text.find(form, from); at != wstring::npos) {
      return Span{at, at + form.size()};
    }
  }
  return std::nullopt;
}

// The second of the two units of a character beyond 16 bits.
bool IsSecondHalf(char16_t unit) { return unit >= 0xDC00 && unit <= 0xDFFF; }

// The font's average width of a character, by the letters of the Latin alphabet.
int AverageCharWidth(platform::Desktop& desktop, const platform::Font& font) {
  constexpr std::u16string_view kLetters = u"ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz";
  const int width = desktop.MeasureText(kLetters, kNoBreak, font).Width();
  return std::max(1, width / static_cast<int>(kLetters.size()));
}

// Puts pieces behind one another and begins a new line where one does not fit.
class LineBreaker {
 public:
  LineBreaker(platform::Desktop& desktop, const platform::Font& font, int paneWidth, int paneHeight, int charWidth)
      : desktop_(desktop), font_(font), right_(paneWidth - kMargin), bottom_(paneHeight), charWidth_(charWidth) {}

  void Add(const TextPiece& piece) {
    std::u16string_view rest = piece.text;
    while (!rest.empty() && y_ < bottom_) {
      const std::size_t lineEnd = std::min(rest.find(u'\n'), rest.size());
      const std::size_t count = FittingCount(rest.substr(0, lineEnd));
      if (count > 0) {
        const wstring text(rest.substr(0, count));
        placed_.push_back({x_, y_, {text, piece.background}});
        x_ += WidthOf(text);
      }
      rest.remove_prefix(count);
      if (!rest.empty()) {
        NextLine();
        rest.remove_prefix(rest.front() == u'\n' ? 1 : 0);
      }
    }
  }
  std::vector<PlacedText> Take() { return std::move(placed_); }

 private:
  int WidthOf(std::u16string_view text) { return desktop_.MeasureText(text, kNoBreak, font_).Width(); }

  void NextLine() {
    x_ = kMargin;
    y_ += kLineHeight;
  }

  // How many characters go on the rest of the line: as many as the average width lets through, and fewer where that
  // guess would let letters run over the pane's edge. An empty line takes one in any case. A character of two units
  // stays whole: a half of it cannot be drawn, nor what is on the line with it.
  std::size_t FittingCount(std::u16string_view text) {
    const int room = right_ - x_;
    const bool emptyLine = x_ == kMargin;
    std::size_t count = std::min(text.size(), static_cast<std::size_t>(std::max(0, room / charWidth_)));
    while (count > 0 && WidthOf(text.substr(0, count)) > room) {
      --count;
    }
    if (emptyLine && !text.empty()) {
      count = std::max<std::size_t>(count, 1);
    }
    if (count > 0 && count < text.size() && IsSecondHalf(text[count])) {
      return emptyLine && count == 1 ? 2 : count - 1;
    }
    return count;
  }

  platform::Desktop& desktop_;
  const platform::Font& font_;
  int right_;
  int bottom_;
  int charWidth_;
  int x_ = kMargin;
  int y_ = kMargin;
  std::vector<PlacedText> placed_;
};

}  // namespace

// The red mark is looked for behind the green one first, where it does not need to be told from it; before it
// otherwise.
std::vector<TextPiece> CutAtMarks(const wstring& text, const wstring& greenMark, const wstring& redMark) {
  const std::optional<Span> green = FindMark(text, greenMark, 0);
  if (!green) {
    return {};
  }
  std::optional<Span> red = FindMark(text, redMark, green->end);
  if (!red) {
    red = FindMark(text.substr(0, green->begin), redMark, 0);
  }
  if (!red) {
    return {};
  }
  const bool greenFirst = green->begin <= red->begin;
  const Span& first = greenFirst ? *green : *red;
  const Span& second = greenFirst ? *red : *green;
  const auto part = [&](std::size_t begin, std::size_t end) { return text.substr(begin, end - begin); };
  return {{part(0, first.begin), std::nullopt},
          {part(first.begin, first.end), greenFirst ? kGreen : kRed},
          {part(first.end, second.begin), std::nullopt},
          {part(second.begin, second.end), greenFirst ? kRed : kGreen},
          {text.substr(second.end), std::nullopt}};
}

std::vector<PlacedText> PlacePieces(platform::Desktop& desktop, const std::vector<TextPiece>& pieces,
                                    const platform::Font& font, int paneWidth, int paneHeight) {
  const auto first =
      std::find_if(pieces.begin(), pieces.end(), [](const TextPiece& piece) { return !piece.text.empty(); });
  const bool wide = first != pieces.end() && first->text.front() > kFirstWideText;
  LineBreaker breaker(desktop, font, paneWidth, paneHeight, AverageCharWidth(desktop, font) * (wide ? 2 : 1));
  for (const TextPiece& piece : pieces) {
    breaker.Add(piece);
  }
  return breaker.Take();
}

}  // namespace panelglow
