#include "zxml/arena.h"

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <functional>

namespace cvn {
namespace {

// A small tree (the asset section, a test's) stays in one small block; a
// large one grows to blocks big enough that the heap hands them out as
// separate mappings, which go back to the system when the arena goes.
constexpr size_t kFirstBlock = 4096;
constexpr size_t kLargestBlock = size_t{1} << 20;

}  // namespace

Arena::Arena(Arena&& other) noexcept
    : blocks_(other.blocks_),
      cursor_(other.cursor_),
      limit_(other.limit_),
      next_block_(other.next_block_),
      reserved_(other.reserved_) {
  other.blocks_ = nullptr;
  other.cursor_ = other.limit_ = nullptr;
  other.next_block_ = 0;
  other.reserved_ = 0;
}

Arena& Arena::operator=(Arena&& other) noexcept {
  if (this != &other) {
    release();
    std::swap(blocks_, other.blocks_);
    std::swap(cursor_, other.cursor_);
    std::swap(limit_, other.limit_);
    std::swap(next_block_, other.next_block_);
    std::swap(reserved_, other.reserved_);
  }
  return *this;
}

Arena::~Arena() { release(); }

void Arena::release() {
  for (Block* block = blocks_; block;) {
    Block* next = block->next;
    std::free(block);
    block = next;
  }
  blocks_ = nullptr;
  cursor_ = limit_ = nullptr;
  next_block_ = 0;
  reserved_ = 0;
}

Arena::Block* Arena::newBlock(size_t size) {
  if (size > SIZE_MAX - sizeof(Block)) throw std::bad_alloc();
  void* memory = std::malloc(sizeof(Block) + size);
  if (!memory) throw std::bad_alloc();
  Block* block = static_cast<Block*>(memory);
  block->next = nullptr;
  block->size = size;
  reserved_ += sizeof(Block) + size;
  return block;
}

void* Arena::allocateSlow(size_t size, size_t alignment) {
  if (size > SIZE_MAX - alignment) throw std::bad_alloc();
  const size_t needed = size + alignment;
  if (next_block_ == 0) next_block_ = kFirstBlock;
  if (needed > next_block_ / 4) {
    // A large piece (a long text, a big list) gets a block of its own behind
    // the current one, which goes on being filled.
    Block* block = newBlock(needed);
    char* start = reinterpret_cast<char*>(block + 1);
    if (blocks_) {
      block->next = blocks_->next;
      blocks_->next = block;
    } else {
      blocks_ = block;
      cursor_ = limit_ = start + needed;
    }
    uintptr_t at = (reinterpret_cast<uintptr_t>(start) + alignment - 1) & ~(alignment - 1);
    return reinterpret_cast<void*>(at);
  }
  Block* block = newBlock(next_block_);
  block->next = blocks_;
  blocks_ = block;
  cursor_ = reinterpret_cast<char*>(block + 1);
  limit_ = cursor_ + block->size;
  if (next_block_ < kLargestBlock) next_block_ *= 2;
  return allocate(size, alignment);
}

std::string_view Arena::copyText(std::string_view text) {
  char* copy = static_cast<char*>(allocate(text.size() + 1, 1));
  if (!text.empty()) std::memcpy(copy, text.data(), text.size());
  copy[text.size()] = '\0';
  return std::string_view(copy, text.size());
}

std::string_view Arena::copyCountedText(std::string_view text) {
  if (text.size() > UINT32_MAX - 1) text = text.substr(0, UINT32_MAX - 1);
  const uint32_t size = static_cast<uint32_t>(text.size());
  char* bytes = static_cast<char*>(allocate(sizeof size + size + 1, alignof(uint32_t)));
  std::memcpy(bytes, &size, sizeof size);
  if (size) std::memcpy(bytes + sizeof size, text.data(), size);
  bytes[sizeof size + size] = '\0';
  return std::string_view(bytes + sizeof size, size);
}

std::string_view SharedTexts::share(std::string_view text, Arena& arena) {
  if (text.size() > kLongestShared) return arena.copyCountedText(text);
  if (!slots_) slots_ = std::make_unique<std::string_view[]>(kSlots);
  for (size_t i = std::hash<std::string_view>()(text) & (kSlots - 1);; i = (i + 1) & (kSlots - 1)) {
    std::string_view& slot = slots_[i];
    if (!slot.data()) {
      std::string_view copy = arena.copyCountedText(text);
      // Kept at most half full, so a probe ends soon at an empty slot.
      if (used_ < kSlots / 2) {
        slot = copy;
        ++used_;
      }
      return copy;
    }
    if (slot == text) return slot;
  }
}

void Arena::adopt(Arena&& other) {
  if (this == &other || !other.blocks_) return;
  // Appended behind this arena's current block, so filling goes on there.
  Block* last = other.blocks_;
  while (last->next) last = last->next;
  if (blocks_) {
    last->next = blocks_->next;
    blocks_->next = other.blocks_;
  } else {
    blocks_ = other.blocks_;
    cursor_ = other.cursor_;
    limit_ = other.limit_;
    next_block_ = other.next_block_;
  }
  reserved_ += other.reserved_;
  other.blocks_ = nullptr;
  other.cursor_ = other.limit_ = nullptr;
  other.next_block_ = 0;
  other.reserved_ = 0;
}

}  // namespace cvn
