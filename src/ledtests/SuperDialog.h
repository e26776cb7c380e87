// One attempt of CustomLEDTest: a topmost window with a grid of icons and buttons, which starts the LEDs of the
// device array one after the other and judges the operator's answers. Runs on a thread of its own, which owns the
// window.
#pragma once

#include <cstdint>
#include <vector>

#include "ledtests/ButtonDefStruct.h"
#include "platform/Desktop.h"
#include "platform/Threads.h"

namespace panelglow {

class CustomLEDTest;
struct LEDStruct;
struct LedKind;

class SuperDialog {
 public:
  explicit SuperDialog(CustomLEDTest& test);
  ~SuperDialog();
  SuperDialog(const SuperDialog&) = delete;
  SuperDialog& operator=(const SuperDialog&) = delete;

  /// The dialog thread: from the window's creation to the end of its message loop.
  void CreateSuperDialog();

 private:
  std::intptr_t CustomLEDDlgProc(const platform::Message& message);
  void CustomTimerProc(platform::WindowHandle window);
  void BeginTest(platform::WindowHandle window);
  void EnableCustomWindowCtrls(platform::WindowHandle window, const std::vector<ButtonDefStruct>& buttonInfo);

  bool CreateMainWindow();
  void CreateControls();
  platform::WindowHandle CreateControl(const char* className, std::uint32_t style, const wstring& text,
                                       const platform::Rectangle& place, int id);
  void CreateIcon(const std::string& file, int x, int y);
  void RunLoop();

  int ChooseAfterRepeatCheck(int index);
  void OnCreate(const platform::Message& message);
  std::intptr_t OnCommand(const platform::Message& message);
  std::intptr_t OnTimer(platform::WindowHandle window);
  void OnPaint(platform::WindowHandle window);
  void KeepFocusInside(platform::WindowHandle window);
  void StartWorker(const LedKind& kind);
  void EndWorkers();
  std::intptr_t Answer(platform::WindowHandle window, std::int32_t deviceId);
  std::intptr_t AnswerDrive(platform::WindowHandle window);
  std::intptr_t WrongAnswer(platform::WindowHandle window);
  std::intptr_t Leave(platform::WindowHandle window);
  void AwaitEnd(int number, const LEDStruct& entry);
  void PostCommand(platform::WindowHandle window, std::uint32_t command);
  void SendCommand(platform::WindowHandle window, std::uint32_t command);

  CustomLEDTest& test_;
  platform::Desktop& desktop_;
  platform::WindowHandle window_ = 0;
  std::vector<platform::ThreadHandle> overrunning_;  // workers that were still running when their successor began
};

}  // namespace panelglow
