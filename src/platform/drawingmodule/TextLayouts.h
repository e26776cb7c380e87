// Texts made ready to be drawn: font, language, and the marks of captions.
#pragma once

#include <pango/pangocairo.h>

#include <memory>
#include <string>
#include <string_view>

#include "platform/Desktop.h"
#include "platform/drawingmodule/CairoDrawing.h"

namespace panelglow::platform::desktop {

using Layout = std::unique_ptr<PangoLayout, Deleter<g_object_unref>>;

/// A UTF-8 text in a font, with the character forms of a language as "ja_JP".
Layout MakeLayout(cairo_t* cr, const std::string& text, const Font& font, const std::string& language);

/// How much of a height the lines take that fit into it as a whole; all in pixels.
int HeightOfWholeLines(PangoLayout* layout, int height);

/// A caption without its marks.
struct Caption {
  std::u16string text;
  std::size_t underlined = std::u16string::npos;
};

/// Takes the '&' marks out of a caption: "&&" is one '&', "&x" underlines the x.
Caption ReadCaption(std::u16string_view source);

}  // namespace panelglow::platform::desktop
