// The ZXML text form of a tag tree and its block layouts.
#include "zxml/zXML.h"

#include <zlib.h>

#include <algorithm>
#include <array>
#include <cinttypes>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <new>
#include <string>

#include "zxml/tag.h"
#include "zxml/utf8_text.h"

namespace cvn {

namespace {

constexpr size_t kChunk = 16384;
// Room the size estimate leaves beyond the measured text.
constexpr size_t kSlack = 102;
constexpr char kHeader[] = "\xEF\xBB\xBF?zxml\n";
constexpr size_t kHeaderLength = sizeof kHeader - 1;

#define CVN_CHECK(module, expr) \
  ((expr) ? static_cast<void>(0) : failAssertion((module), __LINE__, #expr))

// How many bytes of `text` the dump keeps: up to the first NUL (the format's
// texts were always C strings) and at most kMaxZxmlText, backing off to the
// start of a UTF-8 sequence that the limit would split.
size_t keptLength(std::string_view text) {
  if (text.empty()) return 0;
  size_t n = std::min(text.size(), kMaxZxmlText);
  if (const void* nul = std::memchr(text.data(), '\0', n))
    return static_cast<size_t>(static_cast<const char*>(nul) - text.data());
  return utf8CutLength(text, n);
}

inline bool opensMarkup(char c) { return c == '+' || c == '*' || c == '-' || c == '~'; }

// Decided from the end backwards: a break that becomes a blank joins its line
// to the one before, which must then be judged with the joined text.
void blankMarkupBreaks(char* text, size_t size, size_t first_break) {
  bool line_has_equals = false;
  for (size_t i = size; i-- > first_break;) {
    if (text[i] == '=') {
      line_has_equals = true;
    } else if (text[i] == '\n') {
      bool markup = line_has_equals || (i + 1 < size && opensMarkup(text[i + 1]));
      if (markup)
        text[i] = ' ';
      else
        line_has_equals = false;
    }
  }
}

// Bytes that make a text need more than a copy: NUL and the line break
// anywhere, "=" in names.
constexpr uint8_t kValueMask = 1;
constexpr uint8_t kNameMask = 2;
constexpr std::array<uint8_t, 256> kSpecialBytes = [] {
  std::array<uint8_t, 256> table{};
  table['\0'] = table['\n'] = kValueMask | kNameMask;
  table['='] = kNameMask;
  return table;
}();
// Real names and values are short; longer texts are searched with memchr.
constexpr size_t kShortText = 256;

__attribute__((noinline)) size_t writeEscapedText(char* out, std::string_view text,
                                                  ZxmlField field) {
  size_t size = keptLength(text);
  if (size == 0) return 0;
  std::memcpy(out, text.data(), size);
  const void* line_break = std::memchr(out, '\n', size);
  if (field == ZxmlField::kValue) {
    if (line_break)
      blankMarkupBreaks(out, size, static_cast<size_t>(static_cast<const char*>(line_break) - out));
    return size;
  }
  // A name's line always goes on with "=" and the value, so no break in a
  // name can start a line that reads as text.
  if (line_break || std::memchr(out, '=', size)) {
    for (size_t i = 0; i < size; ++i) {
      if (out[i] == '=')
        out[i] = '_';
      else if (out[i] == '\n')
        out[i] = ' ';
    }
  }
  // A property's name begins its line: led by a mark, it would read as a
  // tag, an annotation or a close.
  if (opensMarkup(out[0])) out[0] = '_';
  return size;
}

constexpr uint64_t kOnes = 0x0101010101010101ull;

// Non-zero when one of the eight bytes of `word` equals `byte`.
inline uint64_t holdsByte(uint64_t word, uint8_t byte) {
  word ^= kOnes * byte;
  return (word - kOnes) & ~word & (kOnes << 7);
}

// The common case, a short text with nothing to escape, is a look at eight
// bytes at a time and a copy.
inline size_t writeText(char* out, std::string_view text, ZxmlField field) {
  size_t size = text.size();
  if (size > kShortText) return writeEscapedText(out, text, field);
  const bool name = field == ZxmlField::kName;
  const char* bytes = text.data();
  if (name && size && opensMarkup(bytes[0])) return writeEscapedText(out, text, field);
  size_t i = 0;
  for (; i + 8 <= size; i += 8) {
    uint64_t word;
    std::memcpy(&word, bytes + i, 8);
    if (holdsByte(word, '\0') | holdsByte(word, '\n') | (name ? holdsByte(word, '=') : 0))
      return writeEscapedText(out, text, field);
  }
  const uint8_t mask = name ? kNameMask : kValueMask;
  for (; i < size; ++i)
    if (kSpecialBytes[static_cast<unsigned char>(bytes[i])] & mask)
      return writeEscapedText(out, text, field);
  if (size) std::memcpy(out, bytes, size);
  return size;
}

// Text values dominate real trees; they are measured and copied here without
// a call, numbers go through TagValue.
inline size_t valueLength(const TagValue& v) {
  return v.isText() ? std::min(v.text().size(), kMaxZxmlText) : v.isNone() ? 0 : v.textLength();
}

inline size_t nameLength(std::string_view s) { return std::min(s.size(), kMaxZxmlText); }

inline char* writeValue(char* out, const TagValue& v) {
  if (v.isText()) return out + writeText(out, v.text(), ZxmlField::kValue);
  return v.isNone() ? out : out + v.writeText(out);
}

size_t measureAnnotations(const TagList<Annotation>& annotations) {
  size_t size = 0;
  for (const Annotation& a : annotations)
    size += nameLength(a.key) + nameLength(a.text) + 3;  // ~ = \n
  return size;
}

size_t measureTag(const Tag& tag) {
  size_t size = 1 + nameLength(tag.name()) + 1 + (tag.value() ? valueLength(*tag.value()) : 0) + 1;
  size += measureAnnotations(tag.annotations());
  for (const auto& p : tag.properties())
    size += nameLength(p->name()) + 1 + valueLength(p->value()) + 1 +
            measureAnnotations(p->annotations());
  for (const auto& c : tag.children()) size += measureTag(*c);
  if (tag.kind() == Tag::Kind::kBranch) size += 2;
  return size;
}

inline char* writeName(char* out, std::string_view s) {
  return out + writeText(out, s, ZxmlField::kName);
}

char* writeAnnotations(char* out, const TagList<Annotation>& annotations) {
  for (const Annotation& a : annotations) {
    *out++ = '~';
    out = writeName(out, a.key);
    *out++ = '=';
    out += writeText(out, a.text, ZxmlField::kValue);
    *out++ = '\n';
  }
  return out;
}

// Writes the tag's lines; the flags affect this tag only, never its
// descendants.
char* writeTag(char* out, const Tag& tag, DumpClose close, DumpChildren children) {
  bool branch = tag.kind() == Tag::Kind::kBranch;
  *out++ = branch ? '+' : '*';
  out = writeName(out, tag.name());
  *out++ = '=';
  if (tag.value()) out = writeValue(out, *tag.value());
  *out++ = '\n';
  out = writeAnnotations(out, tag.annotations());
  for (const auto& p : tag.properties()) {
    out = writeName(out, p->name());
    *out++ = '=';
    out = writeValue(out, p->value());
    *out++ = '\n';
    out = writeAnnotations(out, p->annotations());
  }
  if (!branch) return out;
  if (children == kWithChildren)
    for (const auto& c : tag.children()) out = writeTag(out, *c, kCloseTags, kWithChildren);
  if (close == kCloseTags) {
    *out++ = '-';
    *out++ = '\n';
  }
  return out;
}

// Kept out of line: inlined into the callers, g++ loses track of the buffer
// size and warns about the final NUL.
__attribute__((noinline)) size_t writeDocument(const Tag& document, char* start, DumpClose close,
                                               DumpChildren children) {
  char* out = start;
  std::memcpy(out, kHeader, kHeaderLength);
  out += kHeaderLength;
  for (const auto& c : document.children()) out = writeTag(out, *c, close, children);
  *out = '\0';
  return static_cast<size_t>(out - start);
}

void appendUint32(std::vector<uint8_t>& out, uint32_t value, bool little_endian) {
  for (int i = 0; i < 4; ++i)
    out.push_back(static_cast<uint8_t>(value >> 8 * (little_endian ? i : 3 - i)));
}

// Sections of a split block: the top level alone, then each child of the top
// tag, followed by a directory of section offsets and lengths.
std::vector<uint8_t> serialiseSplit(const TagTree& tree, bool compressed) {
  std::vector<char> buffer(tree.textSize() + 1, '\0');
  std::string directory;
  char* start = buffer.data();
  char* out = start + tree.dumpText(start, 0, kLeaveTagsOpen, kWithoutChildren);
  auto addSection = [&](const std::string& name, const char* begin, const char* end) {
    std::string line = "[" + name + "]\noffset=" + std::to_string(begin - start) +
                       "\nlength=" + std::to_string(end - begin) + "\n";
    directory += line;
  };
  addSection("Root", start, out);
  for (const auto& child : tree.top().children()) {
    char* begin = out;
    out = writeTag(out, *child, kCloseTags, kWithChildren);
    addSection(zxmlText(child->name(), ZxmlField::kName), begin, out);
  }
  size_t directory_position = static_cast<size_t>(out - start);
  std::vector<uint8_t> payload(start, out);
  payload.insert(payload.end(), directory.begin(), directory.end());
  std::vector<uint8_t> block =
      compressed ? compressLevel9(payload.data(), payload.size(), kZxmlModule, 6) : payload;
  appendUint32(block, static_cast<uint32_t>(directory_position), tree.nativeByteOrder());
  block.push_back(0x01);
  block.push_back(compressed ? 0x01 : 0x00);
  return block;
}

}  // namespace

size_t writeZxmlText(char* out, std::string_view text, ZxmlField field) {
  return writeText(out, text, field);
}

std::string zxmlText(std::string_view text, ZxmlField field) {
  std::string out(std::min(text.size(), kMaxZxmlText), '\0');
  out.resize(writeZxmlText(&out[0], text, field));
  return out;
}

void failAssertion(const char* module, unsigned line, const char* expression) {
  std::fprintf(stderr, "%s:%u: failed assertion `%s'\n", module, line, expression);
  std::abort();
}

std::vector<uint8_t> compressLevel9(const uint8_t* data, size_t size, const char* module,
                                    size_t spare) {
  std::vector<uint8_t> out;
  z_stream strm;
  std::memset(&strm, 0, sizeof strm);
  // An empty stream would be saved as an inventory that holds nothing.
  int ret = deflateInit(&strm, Z_BEST_COMPRESSION);
  if (ret == Z_MEM_ERROR) throw std::bad_alloc();
  CVN_CHECK(module, ret == Z_OK);
  // Ends the stream however this returns, a std::bad_alloc below included.
  std::unique_ptr<z_stream, int (*)(z_stream*)> stream_end(&strm, deflateEnd);
  // The bound zlib guarantees for level 9 with the default window: tiny or
  // incompressible input grows, and one spare output area keeps the loop
  // below from reallocating.
  out.reserve(size + (size >> 12) + (size >> 14) + (size >> 25) + 13 + kChunk + spare);
  size_t used = 0;
  size_t remaining = size;
  for (;;) {
    bool last = remaining <= kChunk;
    size_t chunk = last ? remaining : kChunk;
    strm.next_in = const_cast<Bytef*>(data);
    strm.avail_in = static_cast<uInt>(chunk);
    int flush = last ? Z_FINISH : Z_NO_FLUSH;
    do {
      out.resize(used + kChunk);
      strm.next_out = out.data() + used;
      strm.avail_out = kChunk;
      ret = deflate(&strm, flush);
      CVN_CHECK(module, ret != Z_STREAM_ERROR);
      used += kChunk - strm.avail_out;
    } while (strm.avail_out == 0);
    CVN_CHECK(module, strm.avail_in == 0);
    data += chunk;
    remaining -= chunk;
    if (last) break;
  }
  CVN_CHECK(module, ret == Z_STREAM_END);
  out.resize(used);
  return out;
}

size_t TagTree::textSize() const {
  size_t size = kHeaderLength;
  for (const auto& c : document().children()) size += measureTag(*c);
  return size + kSlack;
}

size_t TagTree::dumpText(char* buffer, size_t offset, DumpClose close,
                         DumpChildren children) const {
  return writeDocument(document(), buffer + offset, close, children);
}

std::vector<uint8_t> TagTree::serialise(BlockCompression compression, BlockLayout layout) const {
  const bool compressed = compression == kCompressed;
  if (layout == kSplitSections) return serialiseSplit(*this, compressed);
  size_t size = textSize();
  if (!compressed) {
    // The text padded with zeros to the estimated size; the zeros stand in
    // for the split and compressed flags.
    std::vector<uint8_t> block(size + 1, 0);
    dumpText(reinterpret_cast<char*>(block.data()), 0, kCloseTags, kWithChildren);
    block.resize(size);
    return block;
  }
  std::vector<char> text(size, '\0');
  size_t length = dumpText(text.data(), 0, kCloseTags, kWithChildren);
  static constexpr uint8_t kTrailer[] = {0x00, 0x01, 'Z', 'X', 'M', 'L'};
  std::vector<uint8_t> block = compressLevel9(reinterpret_cast<const uint8_t*>(text.data()), length,
                                              kZxmlModule, sizeof kTrailer);
  block.insert(block.end(), kTrailer, kTrailer + sizeof kTrailer);
  return block;
}

}  // namespace cvn
