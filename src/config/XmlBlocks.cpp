#include "config/XmlBlocks.h"

#include <new>

namespace panelglow {

namespace {

// What an open block has for users, more than pieces can be in it. That spares counting each piece in two places: the
// true number is put in when the block is closed.
constexpr std::int64_t kOpen = std::int64_t{1} << 32U;

constexpr std::align_val_t kAlignment{XmlBlocks::kBlockSize};

}  // namespace

constinit thread_local XmlBlocks::Left XmlBlocks::left_{nullptr, 0};

struct XmlBlocks::LeftAtThreadEnd {
  ~LeftAtThreadEnd() { TellLeft(nullptr); }
};

void XmlBlocks::TellLeft(Block* next) noexcept {
  static thread_local const LeftAtThreadEnd kAtThreadEnd;
  const auto [block, pieces] = left_;
  left_ = {next, 0};
  if (block != nullptr) {
    Leave(block, pieces);
  }
}

void XmlBlocks::OpenBlock() {
  CloseBlock();
  void* const memory = ::operator new(kBlockSize, kAlignment);
  new (memory) Block{kOpen};
  next_ = static_cast<char*>(memory) + sizeof(Block);
  end_ = static_cast<char*>(memory) + kBlockSize;
  taken_ = 0;
}

void XmlBlocks::CloseBlock() noexcept {
  if (end_ != nullptr) {
    Leave(reinterpret_cast<Block*>(end_ - kBlockSize), kOpen - taken_);
  }
  next_ = end_ = nullptr;
}

void XmlBlocks::Free(Block* block) noexcept { ::operator delete(block, kAlignment); }

}  // namespace panelglow
