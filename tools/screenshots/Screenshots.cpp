// Makes the pictures of docs/screenshots: shows every window that people see on a simulated machine, under virtual
// time, and draws what is on its screen into files.
//
//   panelglow-screenshots FOLDER LOCALE     a process has one command line, so one run has one language
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "board/base/BoardDevio.h"
#include "harness/CDMDiag.h"
#include "harness/DiagnosticManager.h"
#include "ledtests/CustomLEDTest.h"
#include "platform/posix/LazyDrawing.h"
#include "platform/sim/Simulation.h"
#include "platform/sim/person/SimScreen.h"
#include "prompts/PromptState.h"

namespace {

namespace fs = std::filesystem;
namespace desktop = panelglow::platform::desktop;
namespace message = panelglow::platform::message;
namespace sim = panelglow::platform::sim;
using panelglow::CDMDiag;
using panelglow::wstring;
using panelglow::platform::Rectangle;
using panelglow::platform::WindowHandle;

constexpr int kMargin = 10;  // pixels round each window
constexpr const char* kSmallPicture = "small.ppm";
constexpr const char* kPicture = "picture.ppm";
constexpr const char* kLargePicture = "large.ppm";

const wstring kText =
    u"Watch the machine's front while the test runs. Press the first button when you have seen the LED blink.";
const wstring kMarkedText =
    u"Press YES when the LED is green, and NO when it is any other colour or dark. Look at the machine, not at the "
    u"screen.";
const wstring kTextInJapanese = u"機械の前面を見てください。LEDが点滅したら、最初のボタンを押してください。";
const wstring kMarkedTextInJapanese =
    u"LEDが緑色なら「はい」を、他の色か消えている場合は「いいえ」を押してください。画面ではなく機械を見てください。";

std::string ReadFile(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

// A copy of the installation that the pictures' files can be written to; the current folder while it exists.
class Installation {
 public:
  Installation() : folder_(fs::temp_directory_path() / ("panelglow-screenshots-" + std::to_string(::getpid()))) {
    fs::copy(fs::path(PANELGLOW_SOURCE_DIR) / "installation", folder_, fs::copy_options::recursive);
    fs::current_path(folder_);
    WritePicture(kSmallPicture, 120, 80);
    WritePicture(kPicture, 600, 200);
    WritePicture(kLargePicture, 2000, 1600);
  }
  ~Installation() {
    std::error_code ignored;
    fs::current_path("/", ignored);
    fs::remove_all(folder_, ignored);
  }
  Installation(const Installation&) = delete;
  Installation& operator=(const Installation&) = delete;

 private:
  // A picture that shows which part of it is seen: colours by place, and a line every 50 pixels.
  static void WritePicture(const char* name, int width, int height) {
    std::ofstream file(name, std::ios::binary);
    file << "P6\n" << width << " " << height << "\n255\n";
    for (int y = 0; y < height; ++y) {
      for (int x = 0; x < width; ++x) {
        const bool line = x % 50 == 0 || y % 50 == 0;
        file.put(line ? '\xFF' : static_cast<char>(40 + x / 50 % 8 * 20));
        file.put(line ? '\xFF' : static_cast<char>(90 + y / 50 % 8 * 15));
        file.put(line ? '\xFF' : static_cast<char>(x / 400 % 2 == y / 400 % 2 ? 160 : 60));
      }
    }
  }

  fs::path folder_;
};

// The visible windows of a moment, moved so that the upper left corner of them all is at the margin.
desktop::Scene Cropped(desktop::Scene scene) {
  Rectangle all = scene.windows.empty() ? Rectangle{} : scene.windows.front().clip;
  for (const desktop::SceneWindow& window : scene.windows) {
    all = {std::min(all.left, window.clip.left), std::min(all.top, window.clip.top),
           std::max(all.right, window.clip.right), std::max(all.bottom, window.clip.bottom)};
  }
  for (desktop::SceneWindow& window : scene.windows) {
    for (Rectangle* place : {&window.frame, &window.client, &window.clip}) {
      *place = {place->left - all.left + kMargin, place->top - all.top + kMargin, place->right - all.left + kMargin,
                place->bottom - all.top + kMargin};
    }
  }
  scene.width = all.Width() + 2 * kMargin;
  scene.height = all.Height() + 2 * kMargin;
  return scene;
}

// Several moments beside and below one another.
desktop::Scene Sheet(const std::vector<desktop::Scene>& scenes, std::size_t columns) {
  desktop::Scene sheet;
  int width = 0;
  int height = 0;
  for (const desktop::Scene& scene : scenes) {
    width = std::max(width, scene.width - kMargin);
    height = std::max(height, scene.height - kMargin);
  }
  for (std::size_t i = 0; i < scenes.size(); ++i) {
    const int dx = static_cast<int>(i % columns) * width;
    const int dy = static_cast<int>(i / columns) * height;
    for (desktop::SceneWindow window : scenes[i].windows) {
      for (Rectangle* place : {&window.frame, &window.client, &window.clip}) {
        *place = {place->left + dx, place->top + dy, place->right + dx, place->bottom + dy};
      }
      sheet.windows.push_back(std::move(window));
    }
  }
  sheet.width = static_cast<int>(std::min(columns, scenes.size())) * width + kMargin;
  sheet.height = static_cast<int>((scenes.size() + columns - 1) / columns) * height + kMargin;
  return sheet;
}

class Studio {
 public:
  Studio(fs::path folder, sim::Simulation& simulation) : folder_(std::move(folder)), sim_(simulation) {}

  /// Calls `show`, which blocks; notes what is on the screen after a time, and ends the window then. `meanwhile`
  /// happens shortly before.
  void Take(unsigned after_ms, const std::function<void()>& show, std::function<void()> meanwhile = {}) {
    panelglow::ThePromptState().topmost = false;
    const sim::Microseconds now = sim_.Time().Now();
    if (meanwhile) {
      sim_.Time().At(now + sim::Microseconds{after_ms} * 1000 - 100'000, std::move(meanwhile));
    }
    sim_.Time().At(now + sim::Microseconds{after_ms} * 1000, [this] { scenes_.push_back(Cropped(Scene())); });
    sim_.Time().At(now + sim::Microseconds{after_ms} * 1000 + 1000, [this] { End(); });
    show();
  }

  /// Writes what was noted since the last file.
  void Save(const std::string& name, std::size_t columns = 2) {
    desktop::SceneDrawing* drawing = drawing_.Get();
    const std::string path = (folder_ / (name + ".png")).string();
    if (scenes_.empty() || drawing == nullptr || !drawing->WritePng(Sheet(scenes_, columns), path)) {
      throw std::runtime_error(path + " cannot be made");
    }
    scenes_.clear();
    std::printf("%s\n", path.c_str());
  }

  /// Runs the LED test, confirms its prompts, and notes the dialog, and the front panel while a LED of the test is
  /// lit.
  void TakeDialog(const std::vector<const char*>& arguments, const std::string& machineName) {
    panelglow::DiagnosticManager manager(static_cast<int>(arguments.size()), arguments.data(), "", "");
    panelglow::BoardDevio().LoadDriver();
    panelglow::g_objDriverObjectCustom.LoadDriver();
    static auto* const test = new panelglow::CustomLEDTest;  // lives to the end of the process, as in the product
    manager.RegisterSubtest("CustomLEDTest", test);
    std::vector<desktop::Scene> panel;
    for (unsigned tenth = 10; tenth < 600; ++tenth) {
      sim_.Time().At(sim::Microseconds{tenth} * 100'000, [&, tenth] {
        constexpr std::size_t kDialogsControls = 50;
        if (sim_.Windows().Children(Top()).size() < kDialogsControls) {
          tenth % 10 == 0 ? End() : void();
        } else if (panel.empty() && !sim_.Panel().TimeLine().empty() && sim_.Panel().TimeLine().back().lit) {
          panel.push_back(Cropped(sim::SimScreen::PanelScene(sim_.Panel(), machineName)));
          scenes_.push_back(Cropped(Scene()));
        }
      });
    }
    manager.Run();
    if (scenes_.empty()) {
      throw std::runtime_error("the test showed no dialog in which a LED was lit:\n" + sim_.Output());
    }
    panel_ = std::move(panel);
  }

  /// The front panel of the last test.
  void SavePanel(const std::string& name) {
    scenes_ = panel_;
    Save(name);
  }

  WindowHandle Top() {
    const std::vector<WindowHandle> all = sim_.Windows().TopLevelWindows();
    return all.empty() ? 0 : all.back();
  }
  desktop::WindowSystem& Windows() { return sim_.Windows(); }

 private:
  desktop::Scene Scene() { return sim_.Windows().MakeScene(); }

  void End() {
    const WindowHandle top = Top();
    sim_.Windows().Post({top, message::kCommand, 1005, 0});
    for (const WindowHandle child : sim_.Windows().Children(top)) {
      if (sim_.Windows().WindowText(child) == u"_Halcyon_Test_") {
        sim_.Windows().Post({child, message::kClose, 0, 0});
      }
    }
  }

  fs::path folder_;
  sim::Simulation& sim_;
  panelglow::platform::posix::LazyDrawing drawing_;
  std::vector<desktop::Scene> scenes_;
  std::vector<desktop::Scene> panel_;
};

constexpr unsigned kButtonSets = 6;

wstring Wide(const char* text) { return panelglow::platform::WideFromUtf8(text); }

// The three forms with every button set; the configurable family when there is a configuration file.
void TakeForms(Studio& studio, const std::string& suffix) {
  for (unsigned style = 0; style < kButtonSets; ++style) {
    studio.Take(300, [&] { CDMDiag::PopWindow(kText, u"Text", style, nullptr, 0); });
  }
  studio.Save("prompt-text" + suffix);
  for (unsigned style = 0; style < kButtonSets; ++style) {
    studio.Take(300, [&] { CDMDiag::PopWindow(kText, u"Image", style, Wide(kPicture), nullptr, 0); });
  }
  studio.Save("prompt-image" + suffix);
  for (unsigned style = 0; style < kButtonSets; ++style) {
    studio.Take(300, [&] { CDMDiag::PopWindow(kMarkedText, "Marked", style, u"yes", u"no"); });
  }
  studio.Save("prompt-marked" + suffix);
}

void TakeWithConfiguration(const std::string& color, const std::function<void()>& take) {
  std::ofstream("diagconf.ini") << "[WindowSettings]\nBackgroundColor=" << color << "\n";
  take();
  fs::remove("diagconf.ini");
}

void TakeImages(Studio& studio) {
  studio.Take(300, [&] { CDMDiag::PopWindow(kText, u"Small", 4, Wide(kSmallPicture), nullptr, 0); });
  studio.Take(300, [&] { CDMDiag::PopWindow(u"", u"No text", 4, Wide(kSmallPicture), nullptr, 0); });
  studio.Take(300, [&] { CDMDiag::PopWindow(kText, u"No image", 4, u"", nullptr, 0); });
  studio.Take(300, [&] { CDMDiag::PopWindow(kText, u"Unreadable", 4, u"unreadable.png", nullptr, 0); });
  studio.Take(300, [&] { CDMDiag::PopWindow(u"", u"Unreadable", 4, u"unreadable.png", nullptr, 0); });
  studio.Save("prompt-image-small");
  const auto makeSmall = [&] { studio.Windows().MoveWindow(studio.Top(), 0, 0, 700, 500); };
  studio.Take(
      300, [&] { CDMDiag::PopWindow(kText, u"Large", 3, Wide(kLargePicture), nullptr, 0); }, makeSmall);
  studio.Take(
      300, [&] { CDMDiag::PopWindow(kText, u"Large", 3, Wide(kLargePicture), nullptr, 0); },
      [&] {
        makeSmall();
        studio.Windows().Post({studio.Top(), message::kHorizontalScroll, 425U << 16U | 5U, 0});
        studio.Windows().Post({studio.Top(), message::kVerticalScroll, 310U << 16U | 5U, 0});
      });
  studio.Save("prompt-image-large");
  studio.Take(300, [&] { CDMDiag::PopWindow(kText, u"As large as the screen", 3, Wide(kLargePicture), nullptr, 0); });
  studio.Save("prompt-image-full");
}

void TakeCountDowns(Studio& studio) {
  for (const unsigned style : {0U, 3U}) {
    studio.Take(1300, [&] {
      CDMDiag::SetPromptTimeout(30, panelglow::prompt_result::kCancel);
      CDMDiag::PopWindow(kText, u"Text", style | panelglow::kPromptTopmost, nullptr, 0);
    });
    studio.Take(1300, [&] {
      CDMDiag::SetPromptTimeout(30, panelglow::prompt_result::kCancel);
      CDMDiag::PopWindow(kText, u"Image", style | panelglow::kPromptTopmost, Wide(kPicture), nullptr, 0);
    });
  }
  studio.Save("prompt-count-down");
}

void TakeOtherWindows(Studio& studio) {
  studio.Take(1300, [&] { CDMDiag::PopMessageWindow(kText, u"A message for ten seconds", 10, nullptr); });
  studio.Take(1300, [&] { CDMDiag::PopMessageWindow(kText, u"A message without limit", 0, nullptr); });
  studio.Save("message-window");
  std::string line;
  const auto type = [&](const char16_t* text) {
    for (const char16_t* at = text; *at != 0; ++at) {
      studio.Windows().Key(0, *at, false);
    }
  };
  studio.Take(
      1300, [&] { CDMDiag::PopTextWindow(u"Scan the label on the back.", u"Serial number", line, 5000); },
      [&] { type(u"5CD-4471-0098"); });
  studio.Take(
      1300, [&] { CDMDiag::PopTextWindow(kText, u"Serial number", line, 5000); },
      [&] { type(u"a line that is longer than the field and goes on behind its end"); });
  studio.Save("text-window");
}

void TakeJapanese(Studio& studio) {
  studio.Take(300, [&] { CDMDiag::PopWindow(kTextInJapanese, u"文", 3, nullptr, 0); });
  studio.Take(300, [&] { CDMDiag::PopWindow(kMarkedTextInJapanese, "", 2, u"はい", u"いいえ"); });
  studio.Take(300, [&] { CDMDiag::PopWindow(kTextInJapanese, u"画像", 3, Wide(kPicture), nullptr, 0); });
  studio.Take(1300, [&] { CDMDiag::PopMessageWindow(kTextInJapanese, u"お知らせ", 10, nullptr); });
  studio.Save("prompts-ja");
}

void TakeAll(const fs::path& folder, const std::string& locale) {
  const bool english = locale == "en_US";
  const std::string localeArgument = "-locale=" + locale;
  const std::vector<const char*> arguments{"panelglow-diags", "-subtest=CustomLEDTest", "-SectionID=Everything",
                                           localeArgument.c_str()};
  sim::SimulationOptions options;
  options.realFiles = true;
  {
    const std::string machineText = ReadFile(fs::path(PANELGLOW_SOURCE_DIR) / "machines" / "desktop.toml");
    sim::Simulation machine(machineText, options);
    Studio studio(folder, machine);
    studio.TakeDialog(arguments, sim::ParseMachine(machineText, "desktop.toml").name);
    studio.Save(english ? "dialog" : "dialog-" + locale.substr(0, 2));
    if (english) {
      studio.SavePanel("front-panel");
    }
  }
  sim::Simulation machine("", options);
  Studio studio(folder, machine);
  const panelglow::DiagnosticManager manager(static_cast<int>(arguments.size()), arguments.data(), "", "");
  if (!english) {
    TakeJapanese(studio);
    return;
  }
  TakeForms(studio, "");
  TakeWithConfiguration("255", [&] { TakeForms(studio, "-red"); });
  TakeWithConfiguration("0", [&] { TakeForms(studio, "-black"); });
  TakeImages(studio);
  TakeCountDowns(studio);
  TakeOtherWindows(studio);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fprintf(stderr, "usage: panelglow-screenshots FOLDER LOCALE\n");
    return 2;
  }
  try {
    const fs::path folder = fs::absolute(argv[1]);
    const Installation installation;
    TakeAll(folder, argv[2]);
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "panelglow-screenshots: %s\n", failure.what());
    return 1;
  }
  return 0;
}
