#include "prompts/PromptImage.h"

#include <algorithm>
#include <memory>
#include <utility>

#include "harness/base/CDMout.h"
#include "platform/Host.h"
#include "prompts/PromptParts.h"

namespace panelglow {

namespace message = platform::message;
using platform::Rectangle;
using platform::WindowHandle;

namespace {

constexpr std::uint32_t kAreaStyle = 0x5000000E;
constexpr std::uint32_t kFailedStyle = 0x50800000;
constexpr std::uint32_t kHorizontalBarStyle = 0x50000004;
constexpr std::uint32_t kVerticalBarStyle = 0x50000005;
constexpr int kAreaId = 1008;
constexpr PixelSize kFailedSize{490, 160};

}  // namespace

PromptImage::PromptImage(platform::Desktop& desktop, wstring path) : desktop_(desktop), path_(std::move(path)) {
  if (path_.empty()) {
    return;
  }
  if (const std::optional<platform::ImageSize> size = platform::TheHost().images.Size(path_)) {
    loaded_ = PixelSize{size->width, size->height};
  } else {
    CDMout::LogMessage(LogOptions::Debug, kNote, "Error Loading Image File.");
  }
  size_ = loaded_.value_or(kFailedSize);
}

void PromptImage::Create(WindowHandle parent, const PicturePlaces& places) {
  area_ = CreateControl(
      desktop_, parent,
      {"STATIC", loaded_ ? kAreaStyle : kFailedStyle, kAreaId, places.area, loaded_ ? wstring() : path_});
  horizontalBar_ =
      CreateControl(desktop_, parent, {"SCROLLBAR", kHorizontalBarStyle, 0, places.horizontalBar, wstring()});
  verticalBar_ = CreateControl(desktop_, parent, {"SCROLLBAR", kVerticalBarStyle, 0, places.verticalBar, wstring()});
  SetRanges();
}

void PromptImage::Place(const PicturePlaces& places) {
  x_ = 0;
  y_ = 0;
  if (area_ != 0) {
    MoveControl(desktop_, area_, places.area);
    SetRanges();
    MoveControl(desktop_, horizontalBar_, places.horizontalBar);
    MoveControl(desktop_, verticalBar_, places.verticalBar);
  }
}

// Both bars show the whole image's size and a page of the area's; a bar is there only when the image is larger.
void PromptImage::SetRanges() {
  const Rectangle area = desktop_.ClientRectangle(area_);
  desktop_.SetScroll(horizontalBar_, {0, size_.width, area.Width(), 0});
  desktop_.SetScroll(verticalBar_, {0, size_.height, area.Height(), 0});
  desktop_.ShowWindow(horizontalBar_, size_.width > area.Width());
  desktop_.ShowWindow(verticalBar_, size_.height > area.Height());
}

void PromptImage::Scroll(const platform::Message& scroll) {
  const bool vertical = scroll.id == message::kVerticalScroll;
  const WindowHandle bar = vertical ? verticalBar_ : horizontalBar_;
  const int largest = vertical ? size_.height : size_.width;
  platform::ScrollState state = desktop_.Scroll(bar);
  switch (scroll.wParam & 0xFFFFU) {
    case platform::scroll::kLineBack:
      state.position = std::max(0, state.position - 1);
      break;
    case platform::scroll::kLineForward:
      state.position = std::min(largest, state.position + 1);
      break;
    case platform::scroll::kThumbPosition:
    case platform::scroll::kThumbTrack:
      state.position = static_cast<int>(scroll.wParam >> 16U & 0xFFFFU);
      break;
    case platform::scroll::kStart:
      state.position = 0;
      break;
    case platform::scroll::kEnd:
      state.position = largest;
      break;
    default:
      break;
  }
  (vertical ? y_ : x_) = state.position;
  desktop_.SetScroll(bar, state);
}

void PromptImage::Paint() const {
  if (loaded_) {
    desktop_.BeginPaint(area_)->DrawImage(-x_, -y_, path_, desktop_.ClientRectangle(area_));
  }
}

}  // namespace panelglow
