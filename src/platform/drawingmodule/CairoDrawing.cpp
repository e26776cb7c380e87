#include "platform/drawingmodule/CairoDrawing.h"

#include <pango/pangocairo.h>

#include <algorithm>

#include "platform/Text.h"
#include "platform/desktop/ScrollParts.h"
#include "platform/drawingmodule/TextLayouts.h"

namespace panelglow::platform::desktop {

namespace {

constexpr int kIconSize = 32;  // pixels
// Larger pictures are treated as unreadable: a small file can claim a size that takes all memory.
constexpr int kLargestImageSide = 16384;         // pixels
constexpr long long kMostImagePixels = 1 << 26;  // 64 million: 256 MB of memory
constexpr Color kButtonColor = 0x00E8E8E8;
constexpr Color kPressedColor = 0x00D0D0D0;
constexpr Color kWhite = 0x00FFFFFF;
constexpr Color kSelection = 0x00D77800;
constexpr Color kFaintText = 0x00808080;

void SetColor(cairo_t* cr, Color color) {
  cairo_set_source_rgb(cr, (color & 0xFFU) / 255.0, (color >> 8U & 0xFFU) / 255.0, (color >> 16U & 0xFFU) / 255.0);
}

void FillRectangle(cairo_t* cr, const Rectangle& area, Color color) {
  SetColor(cr, color);
  cairo_rectangle(cr, area.left, area.top, area.Width(), area.Height());
  cairo_fill(cr);
}

// The dark side of what stands on a ground; a light grey where the ground is dark itself.
Color ShadowOn(Color ground) {
  constexpr Color kOnDark = 0x00808080;
  if (ReadableOn(ground) != 0) {
    return kOnDark;
  }
  const auto part = [&](unsigned shift) { return (ground >> shift & 0xFFU) * 3 / 8 << shift; };
  return part(0) | part(8) | part(16);
}

// A one pixel frame, light and dark as if lit from the top left.
void DrawBevel(cairo_t* cr, const Rectangle& area, Color topLeft, Color bottomRight) {
  cairo_set_line_width(cr, 1);
  SetColor(cr, topLeft);
  cairo_move_to(cr, area.left + 0.5, area.bottom - 0.5);
  cairo_line_to(cr, area.left + 0.5, area.top + 0.5);
  cairo_line_to(cr, area.right - 0.5, area.top + 0.5);
  cairo_stroke(cr);
  SetColor(cr, bottomRight);
  cairo_move_to(cr, area.right - 0.5, area.top + 0.5);
  cairo_line_to(cr, area.right - 0.5, area.bottom - 0.5);
  cairo_line_to(cr, area.left + 0.5, area.bottom - 0.5);
  cairo_stroke(cr);
}

void DrawPixbuf(cairo_t* cr, const GdkPixbuf* image, int x, int y) {
  const int width = gdk_pixbuf_get_width(image);
  const int height = gdk_pixbuf_get_height(image);
  const Surface surface(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, width, height));
  if (cairo_surface_status(surface.get()) != CAIRO_STATUS_SUCCESS) {
    return;
  }
  cairo_surface_flush(surface.get());
  unsigned char* target = cairo_image_surface_get_data(surface.get());
  const int targetStride = cairo_image_surface_get_stride(surface.get());
  const guint8* source = gdk_pixbuf_read_pixels(image);
  const int sourceStride = gdk_pixbuf_get_rowstride(image);
  const int channels = gdk_pixbuf_get_n_channels(image);
  for (int row = 0; row < height; ++row) {
    const guint8* from = source + static_cast<std::ptrdiff_t>(row) * sourceStride;
    auto* to = reinterpret_cast<std::uint32_t*>(target + static_cast<std::ptrdiff_t>(row) * targetStride);
    for (int column = 0; column < width; ++column, from += channels) {
      const std::uint32_t alpha = channels == 4 ? from[3] : 255U;
      const auto part = [&](int index) { return from[index] * alpha / 255U; };
      to[column] = alpha << 24U | part(0) << 16U | part(1) << 8U | part(2);
    }
  }
  cairo_surface_mark_dirty(surface.get());
  cairo_set_source_surface(cr, surface.get(), x, y);
  cairo_paint(cr);
}

std::string FilePath(std::u16string_view path) {
  std::string name = Utf8FromWide(path);
  std::replace(name.begin(), name.end(), '\\', '/');
  return name;
}

Color TextColor(const SceneWindow& window, Color ground) { return window.enabled ? ReadableOn(ground) : kFaintText; }

// A caption on one line in the middle of a button; what is too long ends in an ellipsis.
void DrawButtonCaption(cairo_t* cr, const SceneWindow& window, Color ground, const std::string& language) {
  constexpr int kMargin = 4;  // pixels
  const Caption caption = ReadCaption(window.text);
  const Layout layout = MakeLayout(cr, Utf8FromWide(caption.text), window.font, language);
  if (caption.underlined != std::u16string::npos) {
    const std::u16string_view before = std::u16string_view(caption.text).substr(0, caption.underlined);
    const std::size_t begin = Utf8FromWide(before).size();
    const bool isPair = (caption.text[caption.underlined] & 0xFC00) == 0xD800;
    const std::size_t end =
        Utf8FromWide(std::u16string_view(caption.text).substr(0, caption.underlined + (isPair ? 2 : 1))).size();
    PangoAttrList* attributes = pango_attr_list_new();
    PangoAttribute* underline = pango_attr_underline_new(PANGO_UNDERLINE_SINGLE);
    underline->start_index = static_cast<guint>(begin);
    underline->end_index = static_cast<guint>(end);
    pango_attr_list_insert(attributes, underline);
    pango_layout_set_attributes(layout.get(), attributes);
    pango_attr_list_unref(attributes);
  }
  pango_layout_set_single_paragraph_mode(layout.get(), TRUE);
  pango_layout_set_ellipsize(layout.get(), PANGO_ELLIPSIZE_END);
  pango_layout_set_width(layout.get(), std::max(0, window.frame.Width() - 2 * kMargin) * PANGO_SCALE);
  pango_layout_set_alignment(layout.get(), PANGO_ALIGN_CENTER);
  int height = 0;
  pango_layout_get_pixel_size(layout.get(), nullptr, &height);
  cairo_move_to(cr, window.frame.left + kMargin, window.frame.top + (window.frame.Height() - height) / 2.0);
  SetColor(cr, TextColor(window, ground));
  pango_cairo_show_layout(cr, layout.get());
}

// The lines of a static control. A line that does not fit as a whole is left out, and an ellipsis says so.
void DrawStaticText(cairo_t* cr, const SceneWindow& window, const std::string& language) {
  constexpr int kMargin = 2;  // pixels, left and right
  const Layout layout = MakeLayout(cr, Utf8FromWide(window.text), window.font, language);
  pango_layout_set_width(layout.get(), std::max(0, window.client.Width() - 2 * kMargin) * PANGO_SCALE);
  pango_layout_set_height(layout.get(), std::max(0, window.client.Height() - 1) * PANGO_SCALE);
  pango_layout_set_wrap(layout.get(), PANGO_WRAP_WORD_CHAR);
  pango_layout_set_ellipsize(layout.get(), PANGO_ELLIPSIZE_END);
  pango_layout_set_alignment(layout.get(), window.centred ? PANGO_ALIGN_CENTER : PANGO_ALIGN_LEFT);
  cairo_move_to(cr, window.client.left + kMargin, window.client.top + 1);
  SetColor(cr, TextColor(window, window.background));
  pango_cairo_show_layout(cr, layout.get());
}

// Where a character of an entry field's line begins, in pixels from the line's beginning.
int PlaceInLine(PangoLayout* layout, const std::u16string& text, std::size_t character) {
  const std::size_t before = Utf8FromWide(std::u16string_view(text).substr(0, character)).size();
  PangoRectangle place{};
  pango_layout_get_cursor_pos(layout, static_cast<int>(before), &place, nullptr);
  return PANGO_PIXELS(place.x);
}

// An entry field: one line that is moved so that the caret can be seen.
void DrawEdit(cairo_t* cr, const SceneWindow& window, const std::string& language) {
  constexpr int kMargin = 4;  // pixels, left and right
  FillRectangle(cr, window.frame, kWhite);
  DrawBevel(cr, window.frame, 0x00606060, kWhite);
  const Layout layout = MakeLayout(cr, Utf8FromWide(window.text), window.font, language);
  pango_layout_set_single_paragraph_mode(layout.get(), TRUE);
  int height = 0;
  pango_layout_get_pixel_size(layout.get(), nullptr, &height);
  const int caretX = PlaceInLine(layout.get(), window.text, window.caret);
  const int x = window.client.left + kMargin - std::max(0, caretX - (window.client.Width() - 2 * kMargin));
  const double y = window.client.top + (window.client.Height() - height) / 2.0;
  cairo_save(cr);
  cairo_rectangle(cr, window.client.left, window.client.top, window.client.Width(), window.client.Height());
  cairo_clip(cr);
  cairo_move_to(cr, x, y);
  SetColor(cr, TextColor(window, kWhite));
  pango_cairo_show_layout(cr, layout.get());
  if (window.focused && window.selectionBegin != window.selectionEnd) {
    const int begin = x + PlaceInLine(layout.get(), window.text, window.selectionBegin);
    const int end = x + PlaceInLine(layout.get(), window.text, window.selectionEnd);
    const Rectangle selected{begin, static_cast<int>(y), end, static_cast<int>(y) + height};
    cairo_save(cr);
    cairo_rectangle(cr, selected.left, selected.top, selected.Width(), selected.Height());
    cairo_clip(cr);
    FillRectangle(cr, selected, kSelection);
    cairo_move_to(cr, x, y);
    SetColor(cr, kWhite);
    pango_cairo_show_layout(cr, layout.get());
    cairo_restore(cr);
  }
  if (window.focused) {
    FillRectangle(cr, {x + caretX + 1, static_cast<int>(y), x + caretX + 2, static_cast<int>(y) + height}, 0);
  }
  cairo_restore(cr);
}

// A colour of its own makes a button that colour, darker while it is pressed.
Color ButtonColor(const SceneWindow& window) {
  if (!window.ownBackground) {
    return window.pressed ? kPressedColor : kButtonColor;
  }
  const auto part = [&](unsigned shift) {
    const Color full = *window.ownBackground >> shift & 0xFFU;
    return (window.pressed ? full * 7 / 8 : full) << shift;
  };
  return part(0) | part(8) | part(16);
}

void DrawButton(cairo_t* cr, const SceneWindow& window, const std::string& language) {
  const Color ground = ButtonColor(window);
  const Color line = ReadableOn(ground);
  FillRectangle(cr, window.frame, ground);
  DrawBevel(cr, window.frame, kWhite, ShadowOn(ground));
  if (window.heavyFrame) {
    cairo_set_line_width(cr, 1);
    SetColor(cr, line);
    cairo_rectangle(cr, window.frame.left + 0.5, window.frame.top + 0.5, window.frame.Width() - 1,
                    window.frame.Height() - 1);
    cairo_stroke(cr);
  }
  DrawButtonCaption(cr, window, ground, language);
  if (window.focused) {
    const double dashes[] = {1, 1};
    cairo_set_dash(cr, dashes, 2, 0);
    SetColor(cr, line);
    cairo_rectangle(cr, window.frame.left + 3.5, window.frame.top + 3.5, window.frame.Width() - 7,
                    window.frame.Height() - 7);
    cairo_stroke(cr);
    cairo_set_dash(cr, nullptr, 0, 0);
  }
}

// An arrow of a scroll bar: a bevelled field with a triangle.
void DrawArrow(cairo_t* cr, const Rectangle& area, bool vertical, bool back) {
  FillRectangle(cr, area, 0x00E8E8E8);
  DrawBevel(cr, area, 0x00FFFFFF, 0x00606060);
  const double x = (area.left + area.right) / 2.0;
  const double y = (area.top + area.bottom) / 2.0;
  const double tip = back ? -3 : 3;
  SetColor(cr, 0x00000000);
  if (vertical) {
    cairo_move_to(cr, x, y + tip);
    cairo_line_to(cr, x - 4, y - tip / 2);
    cairo_line_to(cr, x + 4, y - tip / 2);
  } else {
    cairo_move_to(cr, x + tip, y);
    cairo_line_to(cr, x - tip / 2, y - 4);
    cairo_line_to(cr, x - tip / 2, y + 4);
  }
  cairo_close_path(cr);
  cairo_fill(cr);
}

void DrawScrollBar(cairo_t* cr, const SceneWindow& window) {
  const ScrollParts parts = PartsOfScrollBar(window.frame, window.vertical, window.scroll);
  FillRectangle(cr, window.frame, 0x00D0D0D0);
  DrawArrow(cr, parts.backArrow, window.vertical, true);
  DrawArrow(cr, parts.forwardArrow, window.vertical, false);
  if (parts.travel > 0) {
    FillRectangle(cr, parts.thumb, window.pressed ? 0x00B0B0B0 : 0x00E8E8E8);
    DrawBevel(cr, parts.thumb, 0x00FFFFFF, 0x00606060);
  }
}

}  // namespace

bool CairoDrawing::WritePng(const Scene& scene, const std::string& path) {
  const Surface surface(cairo_image_surface_create(CAIRO_FORMAT_RGB24, scene.width, scene.height));
  const Context context(cairo_create(surface.get()));
  FillRectangle(context.get(), {0, 0, scene.width, scene.height}, scene.background);
  for (const SceneWindow& window : scene.windows) {
    DrawWindow(context.get(), window, scene.language);
  }
  return cairo_surface_write_to_png(surface.get(), path.c_str()) == CAIRO_STATUS_SUCCESS;
}

std::optional<std::pair<int, int>> CairoDrawing::ImageSize(const std::string& path) {
  const GdkPixbuf* image = Load(path);
  if (image == nullptr) {
    return std::nullopt;
  }
  return std::pair{gdk_pixbuf_get_width(image), gdk_pixbuf_get_height(image)};
}

std::pair<int, int> CairoDrawing::MeasureText(std::u16string_view text, int width, const Font& font,
                                              const std::string& language) {
  const Surface surface(cairo_image_surface_create(CAIRO_FORMAT_RGB24, 1, 1));
  const Context context(cairo_create(surface.get()));
  const Layout layout = MakeLayout(context.get(), Utf8FromWide(text), font, language);
  pango_layout_set_width(layout.get(), width * PANGO_SCALE);
  pango_layout_set_wrap(layout.get(), PANGO_WRAP_WORD_CHAR);
  int w = 0;
  int h = 0;
  pango_layout_get_pixel_size(layout.get(), &w, &h);
  return {w, h};
}

// Null when the file does not decode. An image stays in memory for the next drawing, as long as its file is the same.
const GdkPixbuf* CairoDrawing::Load(const std::string& path) {
  std::error_code missing;
  const std::filesystem::file_time_type written = std::filesystem::last_write_time(path, missing);
  const std::uintmax_t fileSize = std::filesystem::file_size(path, missing);
  const auto known = images_.find(path);
  if (known != images_.end() && known->second.written == written && known->second.fileSize == fileSize) {
    return known->second.pixels.get();
  }
  int width = 0;
  int height = 0;
  Pixbuf image;
  if (gdk_pixbuf_get_file_info(path.c_str(), &width, &height) != nullptr && width <= kLargestImageSide &&
      height <= kLargestImageSide && static_cast<long long>(width) * height <= kMostImagePixels) {
    image.reset(gdk_pixbuf_new_from_file(path.c_str(), nullptr));
  }
  return images_.insert_or_assign(path, Image{written, fileSize, std::move(image)}).first->second.pixels.get();
}

void CairoDrawing::DrawOperations(cairo_t* cr, const SceneWindow& window, const std::string& language) {
  cairo_save(cr);
  cairo_rectangle(cr, window.client.left, window.client.top, window.client.Width(), window.client.Height());
  cairo_clip(cr);
  cairo_translate(cr, window.client.left, window.client.top);
  for (const DrawOperation& operation : window.operations) {
    std::visit([&](const auto& step) { Draw(cr, step, language); }, operation);
  }
  cairo_restore(cr);
}

void CairoDrawing::Draw(cairo_t* cr, const FillOperation& fill, const std::string& /*language*/) {
  FillRectangle(cr, fill.area, fill.color);
}

void CairoDrawing::Draw(cairo_t* cr, const DiscOperation& disc, const std::string& /*language*/) {
  constexpr double kFullTurn = 6.283185307179586;
  SetColor(cr, disc.color);
  cairo_arc(cr, (disc.area.left + disc.area.right) / 2.0, (disc.area.top + disc.area.bottom) / 2.0,
            disc.area.Width() / 2.0, 0, kFullTurn);
  cairo_fill(cr);
}

void CairoDrawing::Draw(cairo_t* cr, const TextOperation& text, const std::string& language) {
  const Layout layout = MakeLayout(cr, Utf8FromWide(text.text), text.font, language);
  cairo_save(cr);
  if (text.boxed) {
    if (text.layout.wordBreak) {
      pango_layout_set_width(layout.get(), text.area.Width() * PANGO_SCALE);
      pango_layout_set_wrap(layout.get(), PANGO_WRAP_WORD_CHAR);
    }
    const int room = text.area.Height();
    cairo_rectangle(cr, text.area.left, text.area.top, text.area.Width(),
                    text.layout.editControl ? HeightOfWholeLines(layout.get(), room) : room);
    cairo_clip(cr);
  }
  if (text.background) {
    int width = 0;
    int height = 0;
    pango_layout_get_pixel_size(layout.get(), &width, &height);
    FillRectangle(cr, {text.area.left, text.area.top, text.area.left + width, text.area.top + height},
                  *text.background);
  }
  cairo_move_to(cr, text.area.left, text.area.top);
  SetColor(cr, text.color);
  pango_cairo_show_layout(cr, layout.get());
  cairo_restore(cr);
}

void CairoDrawing::Draw(cairo_t* cr, const ImageOperation& operation, const std::string& /*language*/) {
  if (const GdkPixbuf* image = Load(FilePath(operation.path))) {
    cairo_save(cr);
    cairo_rectangle(cr, operation.clip.left, operation.clip.top, operation.clip.Width(), operation.clip.Height());
    cairo_clip(cr);
    DrawPixbuf(cr, image, operation.x, operation.y);
    cairo_restore(cr);
  }
}

void CairoDrawing::DrawIcon(cairo_t* cr, const SceneWindow& window) {
  const GdkPixbuf* image = window.iconPath.empty() ? nullptr : Load(FilePath(window.iconPath));
  if (image == nullptr) {
    return;
  }
  if (gdk_pixbuf_get_width(image) == kIconSize && gdk_pixbuf_get_height(image) == kIconSize) {
    DrawPixbuf(cr, image, window.frame.left, window.frame.top);
    return;
  }
  const Pixbuf scaled(gdk_pixbuf_scale_simple(image, kIconSize, kIconSize, GDK_INTERP_BILINEAR));
  if (scaled) {
    DrawPixbuf(cr, scaled.get(), window.frame.left, window.frame.top);
  }
}

void CairoDrawing::DrawWindow(cairo_t* cr, const SceneWindow& window, const std::string& language) {
  cairo_save(cr);
  cairo_rectangle(cr, window.clip.left, window.clip.top, window.clip.Width(), window.clip.Height());
  cairo_clip(cr);
  switch (window.kind) {
    case WindowKind::kButton:
      DrawButton(cr, window, language);
      break;
    case WindowKind::kScrollBar:
      DrawScrollBar(cr, window);
      break;
    case WindowKind::kIcon:
      DrawIcon(cr, window);
      break;
    case WindowKind::kEdit:
      DrawEdit(cr, window, language);
      break;
    case WindowKind::kStatic:
    case WindowKind::kImageArea:
      FillRectangle(cr, window.frame, window.background);
      if (window.border) {
        DrawBevel(cr, window.frame, ShadowOn(window.background), ShadowOn(window.background));
      }
      if (window.kind == WindowKind::kStatic) {
        DrawStaticText(cr, window, language);
      }
      break;
    case WindowKind::kPlain:
      FillRectangle(cr, window.frame, window.background);
      if (window.raisedFrame) {
        DrawBevel(cr, window.frame, 0x00FFFFFF, 0x00404040);
      } else if (window.border) {
        DrawBevel(cr, window.frame, ShadowOn(window.background), ShadowOn(window.background));
      }
      break;
  }
  cairo_restore(cr);
  cairo_save(cr);
  cairo_rectangle(cr, window.clip.left, window.clip.top, window.clip.Width(), window.clip.Height());
  cairo_clip(cr);
  DrawOperations(cr, window, language);
  cairo_restore(cr);
}

}  // namespace panelglow::platform::desktop
