// One attempt of an operator test: a topmost window with a grid of icons and buttons, which starts the LEDs of the
// device array one after the other and judges the operator's answers, by the test's rules. Runs on a thread of its
// own, which owns the window.
#pragma once

#include <cstdint>
#include <vector>

#include "platform/Desktop.h"
#include "platform/Threads.h"

namespace panelglow {

class FrontPanelTest;
struct ButtonAnswer;
struct LEDStruct;
struct LedKind;

class SuperDialog {
 public:
  explicit SuperDialog(FrontPanelTest& test);
  ~SuperDialog();
  SuperDialog(const SuperDialog&) = delete;
  SuperDialog& operator=(const SuperDialog&) = delete;

  /// The dialog thread: from the window's creation to the end of its message loop. Sets the test's `dialogLost` when
  /// there was no window, or when it went away by itself.
  void CreateSuperDialog();

 private:
  // Command ids of the dialog itself.
  static constexpr std::uint32_t kLeaveCommand = 998;
  static constexpr std::uint32_t kNextCommand = 1000;  // of the start button too

  std::intptr_t CustomLEDDlgProc(const platform::Message& message);
  void CustomTimerProc(platform::WindowHandle window);
  void BeginTest(platform::WindowHandle window);
  void EnableCustomWindowCtrls(platform::WindowHandle window);

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
  [[nodiscard]] int FirstButton() const;
  LEDStruct* EntryFor(const LedKind& kind);
  void StartWorker(const LedKind& kind, LEDStruct& entry);
  void EndWorkers();
  [[nodiscard]] const ButtonAnswer* FindAnswer(std::uint32_t button) const;
  std::intptr_t Answer(platform::WindowHandle window, const ButtonAnswer& answer);
  std::intptr_t WrongAnswer(platform::WindowHandle window);
  std::intptr_t Leave(platform::WindowHandle window);
  void AwaitEnd(int number, const LEDStruct& entry);
  void PostCommand(platform::WindowHandle window, std::uint32_t command);
  void SendCommand(platform::WindowHandle window, std::uint32_t command);

  FrontPanelTest& test_;
  platform::Desktop& desktop_;
  platform::WindowHandle window_ = 0;
  std::vector<platform::ThreadHandle> overrunning_;  // workers that were still running when their successor began
};

}  // namespace panelglow
