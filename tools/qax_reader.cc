#include "qax_reader.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <memory>

#include "qax_inflate.h"

namespace cvn {

namespace {

constexpr size_t kTrailerLength = 14;
constexpr size_t kBlockTrailerLength = 6;
constexpr uint64_t kMaxFileSize = uint64_t{1} << 31;
// The most one line of tree text can grow into once read: a node with the
// spare room of the list that holds it and the heap's share of its two
// texts, or a warning and an ambiguity about the line.
constexpr uint64_t kLineCost = 2 * sizeof(QaxNode) + 64;

std::string numberText(uint64_t n) { return std::to_string(n); }

}  // namespace

bool inflateQaxStream(const uint8_t* data, size_t size, std::string* out, std::string* error) {
  return inflateWithin(data, size, out, nullptr, error);
}

namespace {

bool parseNumber(std::string_view text, uint64_t* value) {
  if (text.empty() || text.size() > 19) return false;
  uint64_t n = 0;
  for (char c : text) {
    if (c < '0' || c > '9') return false;
    n = n * 10 + static_cast<uint64_t>(c - '0');
  }
  *value = n;
  return true;
}

uint64_t readUint64(const uint8_t* p, bool little_endian) {
  uint64_t v = 0;
  for (int i = 0; i < 8; ++i) {
    int shift = little_endian ? 8 * i : 8 * (7 - i);
    v |= static_cast<uint64_t>(p[i]) << shift;
  }
  return v;
}

// ---------------------------------------------------------------- directory

struct Section {
  std::string name;
  size_t line = 0;
  std::vector<std::pair<std::string, std::string>> keys;
  const std::string* find(const char* key) const {
    for (const auto& kv : keys)
      if (kv.first == key) return &kv.second;
    return nullptr;
  }
};

bool parseIni(std::string_view text, std::vector<Section>* sections, std::string* error) {
  TextLines lines(text, 0, 0);
  std::string_view line;
  for (TextLines::Step step; (step = lines.next(&line)) != TextLines::Step::kEnd;) {
    const size_t line_number = lines.number();
    if (step == TextLines::Step::kUnterminated) {
      *error = "directory line " + numberText(line_number) + ": no line feed at the end";
      return false;
    }
    if (line.size() >= 2 && line.front() == '[' && line.back() == ']') {
      sections->push_back(Section{std::string(line.substr(1, line.size() - 2)), line_number, {}});
      continue;
    }
    size_t eq = line.find('=');
    if (eq == std::string_view::npos || sections->empty()) {
      *error = "directory line " + numberText(line_number) + ": neither a section nor a key";
      return false;
    }
    sections->back().keys.emplace_back(std::string(line.substr(0, eq)),
                                       std::string(line.substr(eq + 1)));
  }
  return true;
}

bool checkKeys(const Section& s, std::initializer_list<const char*> allowed, std::string* error) {
  for (const auto& kv : s.keys) {
    bool known = false;
    for (const char* a : allowed) known = known || kv.first == a;
    if (!known) {
      *error = "directory section [" + s.name + "]: unexpected key \"" + kv.first + "\"";
      return false;
    }
  }
  return true;
}

bool getNumber(const Section& s, const char* key, uint64_t* value, std::string* error) {
  const std::string* text = s.find(key);
  if (!text) {
    *error = "directory section [" + s.name + "]: no " + key;
    return false;
  }
  if (!parseNumber(*text, value)) {
    *error = "directory section [" + s.name + "]: " + key + " \"" + *text + "\" is not a number";
    return false;
  }
  return true;
}

bool parseDirectory(QaxFile* file, std::string* error) {
  std::vector<Section> sections;
  if (!parseIni(file->directory, &sections, error)) return false;
  if (sections.empty() || sections.front().name != "H") {
    *error = "directory does not start with [H]";
    return false;
  }
  const Section& head = sections.front();
  if (!checkKeys(head, {"count", "snapshotcount"}, error) ||
      !getNumber(head, "count", &file->count, error) ||
      !getNumber(head, "snapshotcount", &file->snapshot_count, error))
    return false;
  if (file->count != sections.size() - 1) {
    *error = "directory count=" + numberText(file->count) + " but it lists " +
             numberText(sections.size() - 1) + " blocks";
    return false;
  }
  uint64_t next_offset = 0;
  for (size_t i = 1; i < sections.size(); ++i) {
    const Section& s = sections[i];
    QaxBlock block;
    block.index = static_cast<unsigned>(i - 1);
    if (s.name != numberText(block.index)) {
      *error = "directory section [" + s.name + "] where [" + numberText(block.index) + "] belongs";
      return false;
    }
    if (!checkKeys(s, {"offset", "length", "type", "timestamp", "snaptype", "ID"}, error) ||
        !getNumber(s, "offset", &block.offset, error) ||
        !getNumber(s, "length", &block.length, error))
      return false;
    const std::string* type = s.find("type");
    if (!type || (*type != "snapshot" && *type != "assetinfo" && *type != "customdata")) {
      *error = "directory section [" + s.name + "]: unknown block type \"" +
               (type ? *type : std::string()) + "\"";
      return false;
    }
    block.type = *type;
    block.kind = *type == "customdata" ? QaxBlock::Kind::kRawData : QaxBlock::Kind::kTree;
    if (const std::string* v = s.find("timestamp")) block.timestamp = *v;
    if (const std::string* v = s.find("snaptype")) block.snaptype = *v;
    if (const std::string* v = s.find("ID")) block.id = *v;
    if (block.offset != next_offset) {
      *error = "block " + s.name + " starts at offset " + numberText(block.offset) +
               " but the block before it ends at " + numberText(next_offset);
      return false;
    }
    if (block.length > file->directory_offset - block.offset) {
      *error = "block " + s.name + " (offset " + numberText(block.offset) + ", length " +
               numberText(block.length) + ") runs past the directory at " +
               numberText(file->directory_offset);
      return false;
    }
    next_offset = block.offset + block.length;
    file->blocks.push_back(std::move(block));
  }
  if (next_offset != file->directory_offset) {
    *error = numberText(file->directory_offset - next_offset) +
             " bytes between the last block and the directory at " +
             numberText(file->directory_offset);
    return false;
  }
  return true;
}

std::string blockWhere(const QaxBlock& b) {
  return "block " + numberText(b.index) + " (" + b.type + ", offset " + numberText(b.offset) + ")";
}

void addWarnings(const QaxBlock& b, const std::vector<std::string>& found,
                 std::vector<std::string>& into) {
  for (const std::string& w : found) into.push_back(blockWhere(b) + " " + w);
}

// What a tree block holds once its trailer is read: the payload as stored
// (inflated when it was compressed) and how much of it is ZXML text.
struct TreePayload {
  std::string inflated;
  std::string_view stored;
  size_t text_length = 0;
  size_t allowed_open = 0;
};

bool readTreePayload(const uint8_t* p, size_t n, QaxBlock* b, bool little_endian,
                     InflateBudget& budget, TreePayload* out, std::string* error) {
  // Text stored plain is paid for too: its tree costs as much.
  auto take = [&](size_t payload_length) {
    std::string detail;
    bool taken = b->compressed ? inflateWithin(p, payload_length, &out->inflated, &budget, &detail)
                               : budget.take(payload_length, &detail);
    if (!taken) *error = blockWhere(*b) + ": " + detail;
    out->stored = b->compressed
                      ? std::string_view(out->inflated)
                      : std::string_view(reinterpret_cast<const char*>(p), payload_length);
    return taken;
  };
  if (n >= kBlockTrailerLength && std::memcmp(p + n - 4, "ZXML", 4) == 0) {
    uint8_t split = p[n - 6], compressed = p[n - 5];
    if (split != 0 || compressed > 1) {
      *error = blockWhere(*b) + ": unknown block flags " + numberText(split) + "/" +
               numberText(compressed) + " before \"ZXML\"";
      return false;
    }
    b->compressed = compressed == 1;
    if (!take(n - kBlockTrailerLength)) return false;
    out->text_length = out->stored.size();
    return true;
  }
  if (n >= kBlockTrailerLength && p[n - 2] == 1 && p[n - 1] <= 1) {
    // Split layout: sections, section directory, its position in the byte
    // order the file's trailer showed, two flags.
    b->split = true;
    b->compressed = p[n - 1] == 1;
    uint32_t position = 0;
    for (int i = 0; i < 4; ++i)
      position |= static_cast<uint32_t>(p[n - 6 + i]) << 8 * (little_endian ? i : 3 - i);
    if (!take(n - kBlockTrailerLength)) return false;
    if (position > out->stored.size()) {
      *error = blockWhere(*b) + ": section directory position lies outside the block";
      return false;
    }
    out->text_length = position;
    out->allowed_open = 1;  // the top tag's close is not part of any section
    return true;
  }
  if (n >= kZxmlHeader.size() && std::memcmp(p, kZxmlHeader.data(), kZxmlHeader.size()) == 0) {
    // Plain text padded with zeros.
    const void* nul = std::memchr(p, 0, n);
    size_t text_length = nul ? static_cast<size_t>(static_cast<const uint8_t*>(nul) - p) : n;
    for (size_t i = text_length; i < n; ++i) {
      if (p[i] != 0) {
        *error = blockWhere(*b) + ": data after the text at block byte " + numberText(i);
        return false;
      }
    }
    if (!take(text_length)) return false;
    out->text_length = text_length;
    return true;
  }
  *error = blockWhere(*b) + ": no \"ZXML\" block trailer";
  return false;
}

bool readTreeBlock(const uint8_t* p, size_t n, QaxBlock* b, QaxFile* file, InflateBudget& budget,
                   bool keep_inflated, std::string* error) {
  TreePayload payload;
  if (!readTreePayload(p, n, b, file->little_endian, budget, &payload, error)) return false;
  b->inflated_size = payload.stored.size();
  std::string_view text = payload.stored.substr(0, payload.text_length);
  // Paid before parsing, so that text of many short lines cannot grow into
  // a tree past the budget; a kept copy of the text is paid for again.
  uint64_t lines = static_cast<uint64_t>(std::count(text.begin(), text.end(), '\n'));
  uint64_t kept = keep_inflated ? payload.stored.size() : 0;
  std::string detail;
  if (!budget.take(lines * kLineCost + kept, &detail)) {
    *error = blockWhere(*b) + ": " + detail;
    return false;
  }
  std::vector<std::string> warnings, ambiguities;
  if (!parseZxmlText(text, &b->tree, &warnings, &detail, payload.allowed_open, &ambiguities)) {
    *error = blockWhere(*b) + " " + detail;
    return false;
  }
  addWarnings(*b, warnings, file->warnings);
  addWarnings(*b, ambiguities, file->ambiguities);
  if (keep_inflated) {
    b->text = std::string(text);
    b->sections = std::string(payload.stored.substr(payload.text_length));
  }
  return true;
}

}  // namespace

const QaxBlock* QaxFile::findBlock(std::string_view type) const {
  for (const QaxBlock& b : blocks)
    if (b.type == type) return &b;
  return nullptr;
}

bool parseQaxImage(const uint8_t* data, size_t size, QaxFile* out, std::string* error,
                   const QaxReadOptions& options) {
  *out = QaxFile();
  InflateBudget budget(options.budget);
  out->size = size;
  if (size < kTrailerLength) {
    *error = "file of " + numberText(size) + " bytes is too short for the 14-byte trailer";
    return false;
  }
  const uint8_t* trailer = data + size - kTrailerLength;
  if (std::memcmp(trailer + 10, "QAX!", 4) != 0) {
    *error = "no \"QAX!\" magic in the last 4 bytes";
    return false;
  }
  if (trailer[8] != 3) {
    *error = "format byte at offset " + numberText(size - 6) + " is " + numberText(trailer[8]) +
             ", not 3";
    return false;
  }
  if (trailer[9] > 1) {
    *error = "directory-compressed flag at offset " + numberText(size - 5) + " is " +
             numberText(trailer[9]);
    return false;
  }
  out->directory_compressed = trailer[9] == 1;
  uint64_t limit = size - kTrailerLength;
  // Either byte order is legal; only one of them can point inside the file.
  uint64_t le = readUint64(trailer, true), be = readUint64(trailer, false);
  if (le <= limit) {
    out->directory_offset = le;
  } else if (be <= limit) {
    out->directory_offset = be;
    out->little_endian = false;
  } else {
    *error = "directory offset in the trailer points past the end of the file";
    return false;
  }
  const uint8_t* dir = data + out->directory_offset;
  size_t dir_size = static_cast<size_t>(limit - out->directory_offset);
  std::string detail;
  if (out->directory_compressed) {
    if (!inflateWithin(dir, dir_size, &out->directory, &budget, &detail)) {
      *error = "directory at offset " + numberText(out->directory_offset) + ": " + detail;
      return false;
    }
  } else {
    out->directory.assign(reinterpret_cast<const char*>(dir), dir_size);
  }
  // Each directory line becomes a key or a block, paid for as a tree line.
  uint64_t directory_lines =
      static_cast<uint64_t>(std::count(out->directory.begin(), out->directory.end(), '\n'));
  uint64_t plain = out->directory_compressed ? 0 : dir_size;
  if (!budget.take(plain + directory_lines * kLineCost, &detail)) {
    *error = "directory at offset " + numberText(out->directory_offset) + ": " + detail;
    return false;
  }
  if (!parseDirectory(out, error)) return false;
  uint64_t snapshots = 0;
  for (QaxBlock& b : out->blocks) {
    const uint8_t* p = data + b.offset;
    size_t n = static_cast<size_t>(b.length);
    if (b.kind == QaxBlock::Kind::kRawData) {
      b.compressed = true;
      if (!inflateWithin(p, n, &b.data, &budget, &detail)) {
        *error = blockWhere(b) + ": " + detail;
        return false;
      }
      b.inflated_size = b.data.size();
      if (!options.keep_inflated) std::string().swap(b.data);
      continue;
    }
    if (!readTreeBlock(p, n, &b, out, budget, options.keep_inflated, error)) return false;
    if (b.tree.top()->name == "Snapshot") ++snapshots;
  }
  if (snapshots != out->snapshot_count)
    out->warnings.push_back("directory snapshotcount=" + numberText(out->snapshot_count) + " but " +
                            numberText(snapshots) + " trees have the top tag Snapshot");
  return true;
}

bool readQaxFile(const std::string& path, QaxFile* out, std::string* error,
                 const QaxReadOptions& options) {
  FILE* f = std::fopen(path.c_str(), "rb");
  if (!f) {
    *error = "cannot open: " + std::string(std::strerror(errno));
    return false;
  }
  std::unique_ptr<FILE, int (*)(FILE*)> guard(f, std::fclose);
  std::string bytes;
  char buf[65536];
  size_t n;
  while ((n = std::fread(buf, 1, sizeof buf, f)) > 0) {
    if (bytes.size() + n > kMaxFileSize) {
      *error = "file is larger than " + numberText(kMaxFileSize >> 20) + " MiB";
      return false;
    }
    bytes.append(buf, n);
  }
  if (std::ferror(f)) {
    *error = "read error";
    return false;
  }
  return parseQaxImage(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size(), out, error,
                       options);
}

}  // namespace cvn
