// Draws scenes of windows with cairo and pango, and decodes image files with gdk-pixbuf.
#pragma once

#include <cairo.h>
#include <gdk-pixbuf/gdk-pixbuf.h>

#include <cstdint>
#include <filesystem>
#include <map>
#include <memory>
#include <string>

#include "platform/desktop/Scene.h"

namespace panelglow::platform::desktop {

/// For the C libraries' objects, each with its own way to be given up.
template <auto Free>
struct Deleter {
  template <class T>
  void operator()(T* object) const {
    Free(object);
  }
};
using Surface = std::unique_ptr<cairo_surface_t, Deleter<cairo_surface_destroy>>;
using Context = std::unique_ptr<cairo_t, Deleter<cairo_destroy>>;
using Pixbuf = std::unique_ptr<GdkPixbuf, Deleter<g_object_unref>>;

class CairoDrawing : public SceneDrawing {
 public:
  bool WritePng(const Scene& scene, const std::string& path) override;
  std::optional<std::pair<int, int>> ImageSize(const std::string& path) override;
  std::pair<int, int> MeasureText(std::u16string_view text, int width, const Font& font,
                                  const std::string& language) override;

  /// Draws one window of a scene, in screen coordinates; `language` is the scene's.
  void DrawWindow(cairo_t* cr, const SceneWindow& window, const std::string& language);

 private:
  const GdkPixbuf* Load(const std::string& path);
  void DrawOperations(cairo_t* cr, const SceneWindow& window, const std::string& language);
  void DrawIcon(cairo_t* cr, const SceneWindow& window);
  void Draw(cairo_t* cr, const FillOperation& fill, const std::string& language);
  void Draw(cairo_t* cr, const DiscOperation& disc, const std::string& language);
  void Draw(cairo_t* cr, const TextOperation& text, const std::string& language);
  void Draw(cairo_t* cr, const ImageOperation& operation, const std::string& language);

  struct Image {
    std::filesystem::file_time_type written;  // of the file that was read
    std::uintmax_t fileSize = 0;
    Pixbuf pixels;  // null for a file that does not decode
  };
  std::map<std::string, Image> images_;
};

}  // namespace panelglow::platform::desktop
