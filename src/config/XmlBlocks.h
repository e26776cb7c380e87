// Where the tree of a large text has its memory. A log of some megabytes has hundreds of thousands of short lists and
// texts; asking the heap for each of them, and giving each back, would take longer than all the rest of loading it.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

namespace panelglow {

/// Hands out memory from large blocks, front to back. A block knows how many of its pieces are in use and goes with
/// the last of them, whichever tree that has got into and whichever thread it ends on; until then all of the block
/// stays. Taking belongs to one thread. A thread that gives pieces back counts by itself those of one block: that
/// block is kept until the thread gives back a piece of another one, or ends.
class XmlBlocks {
 public:
  static constexpr std::size_t kBlockSize = std::size_t{1} << 18U;

  /// Larger pieces are the heap's: they are few, and would leave much of a block unused.
  static constexpr std::size_t kLargestPiece = kBlockSize / 8;

  XmlBlocks() = default;
  XmlBlocks(const XmlBlocks&) = delete;
  XmlBlocks& operator=(const XmlBlocks&) = delete;
  ~XmlBlocks() { CloseBlock(); }

  /// `size` bytes, at most kLargestPiece, aligned for a pointer.
  [[nodiscard]] void* Take(std::size_t size) {
    size = (size + sizeof(void*) - 1) & ~(sizeof(void*) - 1);
    if (static_cast<std::size_t>(end_ - next_) < size) {
      OpenBlock();
    }
    ++taken_;
    next_ += size;
    return next_ - size;
  }

  /// Ends the use of a piece.
  static void GiveBack(void* piece) noexcept {
    // A block's address is a multiple of its size.
    const std::uintptr_t offset = reinterpret_cast<std::uintptr_t>(piece) & (kBlockSize - 1);
    auto* const block = reinterpret_cast<Block*>(static_cast<char*>(piece) - offset);
    if (block != left_.block) {
      TellLeft(block);
    }
    ++left_.pieces;
  }

 private:
  // At the front of its memory.
  struct Block {
    std::atomic<std::int64_t> users;
  };

  // Pieces of a block that this thread has given back and the block does not know of yet.
  struct Left {
    Block* block;
    std::int64_t pieces;
  };
  struct LeftAtThreadEnd;

  static void TellLeft(Block* next) noexcept;
  static void Leave(Block* block, std::int64_t users) noexcept {
    if (block->users.fetch_sub(users, std::memory_order_acq_rel) == users) {
      Free(block);
    }
  }
  static void Free(Block* block) noexcept;
  void OpenBlock();
  void CloseBlock() noexcept;

  static constinit thread_local Left left_;

  char* next_ = nullptr;
  char* end_ = nullptr;     // of the block that pieces are taken from
  std::int64_t taken_ = 0;  // from it
};

}  // namespace panelglow
