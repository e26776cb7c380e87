#include "platform/drawingmodule/TextLayouts.h"

#include <algorithm>
#include <array>
#include <string_view>

namespace panelglow::platform::desktop {

namespace {

using Description = std::unique_ptr<PangoFontDescription, Deleter<pango_font_description_free>>;

// Chinese characters have other forms in each language that writes them; all languages that are not named have the
// last row's.
struct HanForms {
  std::string_view locale;
  const char* families;
};
constexpr std::array<HanForms, 4> kHanForms{{{"zh_CN", "DejaVu Sans, Noto Sans CJK SC, Sans"},
                                             {"zh_TW", "DejaVu Sans, Noto Sans CJK TC, Sans"},
                                             {"ko_KR", "DejaVu Sans, Noto Sans CJK KR, Sans"},
                                             {"", "DejaVu Sans, Noto Sans CJK JP, Sans"}}};

}  // namespace

Layout MakeLayout(cairo_t* cr, const std::string& text, const Font& font, const std::string& language) {
  Layout layout(pango_cairo_create_layout(cr));
  const auto* forms = std::find_if(kHanForms.begin(), kHanForms.end() - 1,
                                   [&](const HanForms& row) { return row.locale == language; });
  const Description description(pango_font_description_from_string(forms->families));
  // A font's height is that of its cell; the letters take about three quarters of it.
  pango_font_description_set_absolute_size(description.get(), font.height * 0.74 * PANGO_SCALE);
  pango_font_description_set_weight(description.get(), static_cast<PangoWeight>(font.weight));
  pango_layout_set_font_description(layout.get(), description.get());
  if (!language.empty()) {
    pango_context_set_language(pango_layout_get_context(layout.get()), pango_language_from_string(language.c_str()));
    pango_layout_context_changed(layout.get());
  }
  pango_layout_set_text(layout.get(), text.data(), static_cast<int>(text.size()));
  return layout;
}

int HeightOfWholeLines(PangoLayout* layout, int height) {
  using Lines = std::unique_ptr<PangoLayoutIter, Deleter<pango_layout_iter_free>>;
  const Lines lines(pango_layout_get_iter(layout));
  int whole = 0;
  do {
    int end = 0;
    pango_layout_iter_get_line_yrange(lines.get(), nullptr, &end);
    if (PANGO_PIXELS(end) > height) {
      break;
    }
    whole = PANGO_PIXELS(end);
  } while (pango_layout_iter_next_line(lines.get()) != 0);
  return whole;
}

Caption ReadCaption(std::u16string_view source) {
  Caption caption;
  for (std::size_t i = 0; i < source.size(); ++i) {
    if (source[i] == u'&' && i + 1 < source.size()) {
      ++i;
      if (source[i] != u'&' && caption.underlined == std::u16string::npos) {
        caption.underlined = caption.text.size();
      }
    }
    caption.text.push_back(source[i]);
  }
  return caption;
}

}  // namespace panelglow::platform::desktop
