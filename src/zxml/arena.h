// Storage for trees that are built once, read, and dropped whole: the parsed
// property list, the raw tree and the snapshot. Each allocation is a bump of
// a pointer inside a large block, and dropping the arena frees a handful of
// blocks instead of one allocation per node, name and text. A scan of a
// machine with many applications makes millions of small nodes; one heap
// allocation apiece cost more than parsing and compressing together, and
// the freed pieces scattered later allocations across the heap.
#ifndef CVN_ZXML_ARENA_H_
#define CVN_ZXML_ARENA_H_

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <new>
#include <string_view>
#include <type_traits>
#include <utility>

namespace cvn {

class Arena {
 public:
  Arena() = default;
  Arena(const Arena&) = delete;
  Arena& operator=(const Arena&) = delete;
  Arena(Arena&& other) noexcept;
  Arena& operator=(Arena&& other) noexcept;
  ~Arena();

  /// Uninitialised room for `size` bytes at `alignment` (a power of two),
  /// valid until the arena is destroyed. Never null; throws std::bad_alloc.
  void* allocate(size_t size, size_t alignment);

  /// A new T in the arena. Its destructor never runs: only types whose
  /// destruction frees nothing outside the arena belong here.
  template <typename T, typename... Args>
  T* make(Args&&... args) {
    return new (allocate(sizeof(T), alignof(T))) T(std::forward<Args>(args)...);
  }

  /// Room for `count` default-constructed Ts.
  template <typename T>
  T* makeArray(size_t count) {
    T* items = static_cast<T*>(allocate(sizeof(T) * count, alignof(T)));
    for (size_t i = 0; i < count; ++i) new (items + i) T();
    return items;
  }

  /// A copy of `text` with a NUL byte after it, so that the copy can also be
  /// handed to C functions.
  std::string_view copyText(std::string_view text);

  /// The same, with the length in the four bytes before the copy, so that
  /// countedText() can find the whole text from its first byte. Cut at
  /// 4 GiB - 2 bytes.
  std::string_view copyCountedText(std::string_view text);

  /// Keeps what `other` holds alive for as long as this arena; `other` is
  /// left empty. Lets values move between trees without copying.
  void adopt(Arena&& other);

  /// Bytes taken from the heap so far (blocks, not what was handed out).
  size_t bytesReserved() const { return reserved_; }

 private:
  struct Block {
    Block* next;
    size_t size;  // usable bytes after the header
  };

  void* allocateSlow(size_t size, size_t alignment);
  Block* newBlock(size_t size);
  void release();

  Block* blocks_ = nullptr;  // the block being filled first
  char* cursor_ = nullptr;
  char* limit_ = nullptr;
  size_t next_block_ = 0;
  size_t reserved_ = 0;
};

/// A list of items kept in an arena, read like a vector. `T` is const for
/// a list its reader may not change.
template <typename T, typename Size = size_t>
class ArenaRange {
 public:
  using Item = std::remove_const_t<T>;

  constexpr ArenaRange() = default;
  constexpr ArenaRange(T* data, Size size) : data_(data), size_(size) {}

  const Item* begin() const { return data_; }
  const Item* end() const { return data_ + size_; }
  size_t size() const { return size_; }
  bool empty() const { return size_ == 0; }
  const Item& operator[](size_t i) const { return data_[i]; }
  const Item& front() const { return data_[0]; }
  const Item& back() const { return data_[size_ - 1]; }

 protected:
  T* data_ = nullptr;
  Size size_ = 0;
};

/// The text copyCountedText() made, from its first byte.
inline std::string_view countedText(const char* bytes) {
  uint32_t size;
  std::memcpy(&size, bytes - sizeof size, sizeof size);
  return std::string_view(bytes, size);
}

/// One counted copy of each short text that a document or tree repeats: the
/// keys and names the profiler writes once per item ("_name", "version",
/// ...), and the names and notes the sections write once per record. The
/// first texts seen are remembered, up to a fixed number, so a document of
/// distinct texts costs one copy of each, as without sharing, and no more.
class SharedTexts {
 public:
  /// A copy of `text` made by copyCountedText(), or an earlier equal one.
  std::string_view share(std::string_view text, Arena& arena);

 private:
  static constexpr size_t kSlots = 4096;
  static constexpr size_t kLongestShared = 64;
  // Empty slots have no data (a stored text always has, even when empty).
  std::unique_ptr<std::string_view[]> slots_;
  size_t used_ = 0;
};

inline void* Arena::allocate(size_t size, size_t alignment) {
  // The common case inline: the current block has room.
  uintptr_t at = (reinterpret_cast<uintptr_t>(cursor_) + alignment - 1) & ~(alignment - 1);
  if (cursor_ && size <= static_cast<size_t>(limit_ - cursor_) &&
      at - reinterpret_cast<uintptr_t>(cursor_) <= static_cast<size_t>(limit_ - cursor_) - size) {
    char* p = reinterpret_cast<char*>(at);
    cursor_ = p + size;
    return p;
  }
  return allocateSlow(size, alignment);
}

}  // namespace cvn

#endif  // CVN_ZXML_ARENA_H_
