#include "qax_reader.h"

#include <zlib.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <memory>

namespace cvn {

namespace {

constexpr size_t kTrailerLength = 14;
constexpr size_t kBlockTrailerLength = 6;
// Real snapshots inflate to a few megabytes; anything far beyond is a bomb.
constexpr size_t kMaxInflated = size_t{256} << 20;
constexpr uint64_t kMaxFileSize = uint64_t{1} << 31;
// Real trees are a dozen levels deep; the limit keeps the recursive
// renderers and destructors safe.
constexpr size_t kMaxDepth = 256;
constexpr char kZxmlHeader[] = "\xEF\xBB\xBF?zxml\n";
constexpr size_t kZxmlHeaderLength = sizeof kZxmlHeader - 1;

std::string numberText(uint64_t n) { return std::to_string(n); }

}  // namespace

bool inflateQaxStream(const uint8_t* data, size_t size, std::string* out, std::string* error) {
  z_stream strm;
  std::memset(&strm, 0, sizeof strm);
  if (inflateInit(&strm) != Z_OK) {
    *error = "cannot start zlib";
    return false;
  }
  std::unique_ptr<z_stream, int (*)(z_stream*)> guard(&strm, inflateEnd);
  out->clear();
  const size_t kStep = 65536;
  size_t used = 0;
  strm.next_in = const_cast<Bytef*>(data);
  strm.avail_in = static_cast<uInt>(size);
  for (;;) {
    if (used >= kMaxInflated) {
      *error = "zlib stream inflates to more than " + numberText(kMaxInflated >> 20) + " MiB";
      return false;
    }
    size_t room = std::min(kStep, kMaxInflated - used);
    out->resize(used + room);
    strm.next_out = reinterpret_cast<Bytef*>(&(*out)[used]);
    strm.avail_out = static_cast<uInt>(room);
    int ret = inflate(&strm, Z_NO_FLUSH);
    used += room - strm.avail_out;
    if (ret == Z_STREAM_END) break;
    if (ret == Z_OK) continue;
    if (ret == Z_BUF_ERROR && strm.avail_in == 0) {
      *error = "zlib stream is truncated (ends after " + numberText(size) + " bytes)";
      return false;
    }
    if (ret == Z_BUF_ERROR) {
      *error = "zlib stream makes no progress at byte " + numberText(size - strm.avail_in);
      return false;
    }
    *error = std::string("corrupt zlib stream at byte ") + numberText(size - strm.avail_in) +
             (strm.msg ? std::string(": ") + strm.msg : std::string());
    return false;
  }
  out->resize(used);
  if (strm.avail_in != 0) {
    *error = numberText(strm.avail_in) + " bytes follow the end of the zlib stream";
    return false;
  }
  return true;
}

namespace {

bool inflateStream(const uint8_t* data, size_t size, std::string* out, std::string* error) {
  return inflateQaxStream(data, size, out, error);
}

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
  size_t line_number = 0;
  size_t pos = 0;
  while (pos < text.size()) {
    ++line_number;
    size_t end = text.find('\n', pos);
    if (end == std::string_view::npos) {
      *error = "directory line " + numberText(line_number) + ": no line feed at the end";
      return false;
    }
    std::string_view line = text.substr(pos, end - pos);
    pos = end + 1;
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

// -------------------------------------------------------------------- ZXML

struct ParseState {
  QaxTree* tree;
  std::vector<QaxNode*> open;
  QaxNode* current = nullptr;         // receives property lines
  QaxProperty* property = nullptr;    // receives annotation lines after it
  std::string* last_value = nullptr;  // receives continuation lines
};

std::string lineError(size_t line, const std::string& what) {
  return "line " + numberText(line) + ": " + what;
}

bool parseZxml(std::string_view text, QaxTree* out, std::vector<std::string>* warnings,
               std::string* error, size_t allowed_open) {
  out->nodes.clear();
  if (text.substr(0, kZxmlHeaderLength) != std::string_view(kZxmlHeader, kZxmlHeaderLength)) {
    *error = lineError(1, "no \"?zxml\" header line with the byte-order mark");
    return false;
  }
  ParseState st;
  st.tree = out;
  size_t pos = kZxmlHeaderLength;
  size_t line_number = 1;
  while (pos < text.size()) {
    ++line_number;
    size_t end = text.find('\n', pos);
    if (end == std::string_view::npos) {
      *error = lineError(line_number, "no line feed at the end of the text");
      return false;
    }
    std::string_view line = text.substr(pos, end - pos);
    pos = end + 1;
    if (line.find('\0') != std::string_view::npos) {
      *error = lineError(line_number, "NUL byte");
      return false;
    }
    if (line == "-") {
      if (st.open.empty()) {
        *error = lineError(line_number, "\"-\" closes no open tag");
        return false;
      }
      st.open.pop_back();
      st.current = nullptr;
      st.property = nullptr;
      st.last_value = nullptr;
      continue;
    }
    size_t eq = line.find('=');
    if (eq == std::string_view::npos) {
      if (!st.last_value) {
        *error = lineError(line_number, "neither a tag, a property nor an annotation");
        return false;
      }
      st.last_value->push_back('\n');
      st.last_value->append(line);
      if (warnings)
        warnings->push_back(lineError(line_number,
                                      "no \"=\"; taken as the continuation of the "
                                      "value above"));
      continue;
    }
    char first = line.front();
    if (first == '+' || first == '*') {
      std::vector<QaxNode>& siblings = st.open.empty() ? out->nodes : st.open.back()->children;
      siblings.emplace_back();
      QaxNode& node = siblings.back();
      node.name = std::string(line.substr(1, eq - 1));
      node.value = std::string(line.substr(eq + 1));
      node.branch = first == '+';
      if (node.branch) {
        if (st.open.size() >= kMaxDepth) {
          *error = lineError(line_number, "tags nested deeper than " + numberText(kMaxDepth));
          return false;
        }
        st.open.push_back(&node);
      }
      st.current = &node;
      st.property = nullptr;
      st.last_value = &node.value;
    } else if (first == '~') {
      std::vector<QaxAnnotation>* list = st.property  ? &st.property->annotations
                                         : st.current ? &st.current->annotations
                                                      : nullptr;
      if (!list) {
        *error = lineError(line_number, "annotation without a tag or property above it");
        return false;
      }
      list->push_back(
          QaxAnnotation{std::string(line.substr(1, eq - 1)), std::string(line.substr(eq + 1))});
      st.last_value = &list->back().text;
    } else {
      if (!st.current) {
        *error = lineError(line_number, "property outside a tag (after a closing \"-\")");
        return false;
      }
      st.current->properties.push_back(
          QaxProperty{std::string(line.substr(0, eq)), std::string(line.substr(eq + 1)), {}});
      st.property = &st.current->properties.back();
      st.last_value = &st.property->value;
    }
  }
  if (out->nodes.empty()) {
    *error = lineError(line_number, "no top tag");
    return false;
  }
  if (st.open.size() > allowed_open) {
    *error = lineError(line_number, numberText(st.open.size()) + " tags still open at the end");
    return false;
  }
  return true;
}

// ------------------------------------------------------------------ blocks

std::string blockWhere(const QaxBlock& b) {
  return "block " + numberText(b.index) + " (" + b.type + ", offset " + numberText(b.offset) + ")";
}

void addWarnings(const QaxBlock& b, std::vector<std::string>& found, QaxFile* file) {
  for (const std::string& w : found) file->warnings.push_back(blockWhere(b) + " " + w);
}

bool readTreeBlock(const uint8_t* p, size_t n, QaxBlock* b, QaxFile* file, std::string* error) {
  std::string detail;
  std::vector<std::string> warnings;
  size_t allowed_open = 0;
  if (n >= kBlockTrailerLength && std::memcmp(p + n - 4, "ZXML", 4) == 0) {
    uint8_t split = p[n - 6], compressed = p[n - 5];
    if (split != 0 || compressed > 1) {
      *error = blockWhere(*b) + ": unknown block flags " + numberText(split) + "/" +
               numberText(compressed) + " before \"ZXML\"";
      return false;
    }
    b->compressed = compressed == 1;
    size_t payload = n - kBlockTrailerLength;
    if (b->compressed) {
      if (!inflateStream(p, payload, &b->text, &detail)) {
        *error = blockWhere(*b) + ": " + detail;
        return false;
      }
    } else {
      b->text.assign(reinterpret_cast<const char*>(p), payload);
    }
  } else if (n >= kBlockTrailerLength && p[n - 2] == 1 && p[n - 1] <= 1) {
    // Split layout: sections, section directory, its position, two flags.
    b->split = true;
    b->compressed = p[n - 1] == 1;
    uint32_t position;
    std::memcpy(&position, p + n - 6, 4);
    std::string payload;
    if (b->compressed) {
      if (!inflateStream(p, n - kBlockTrailerLength, &payload, &detail)) {
        *error = blockWhere(*b) + ": " + detail;
        return false;
      }
    } else {
      payload.assign(reinterpret_cast<const char*>(p), n - kBlockTrailerLength);
    }
    if (position > payload.size()) position = __builtin_bswap32(position);
    if (position > payload.size()) {
      *error = blockWhere(*b) + ": section directory position lies outside the block";
      return false;
    }
    b->text = payload.substr(0, position);
    b->sections = payload.substr(position);
    allowed_open = 1;  // the top tag's close is not part of any section
  } else if (n >= kZxmlHeaderLength && std::memcmp(p, kZxmlHeader, kZxmlHeaderLength) == 0) {
    // Plain text padded with zeros.
    const void* nul = std::memchr(p, 0, n);
    size_t text_length = nul ? static_cast<size_t>(static_cast<const uint8_t*>(nul) - p) : n;
    for (size_t i = text_length; i < n; ++i) {
      if (p[i] != 0) {
        *error = blockWhere(*b) + ": data after the text at block byte " + numberText(i);
        return false;
      }
    }
    b->text.assign(reinterpret_cast<const char*>(p), text_length);
  } else {
    *error = blockWhere(*b) + ": no \"ZXML\" block trailer";
    return false;
  }
  if (!parseZxml(b->text, &b->tree, &warnings, &detail, allowed_open)) {
    *error = blockWhere(*b) + " " + detail;
    return false;
  }
  addWarnings(*b, warnings, file);
  return true;
}

// ---------------------------------------------------------------- renderers

void renderAnnotations(const std::vector<QaxAnnotation>& list, std::string& out) {
  for (const QaxAnnotation& a : list) out += "~" + a.key + "=" + a.text + "\n";
}

void renderNode(const QaxNode& node, std::string& out) {
  out += (node.branch ? "+" : "*") + node.name + "=" + node.value + "\n";
  renderAnnotations(node.annotations, out);
  for (const QaxProperty& p : node.properties) {
    out += p.name + "=" + p.value + "\n";
    renderAnnotations(p.annotations, out);
  }
  if (!node.branch) return;
  for (const QaxNode& c : node.children) renderNode(c, out);
  out += "-\n";
}

// Valid UTF-8 passes through; any other byte is written as the Latin-1
// character of that code so the output is always valid JSON.
void appendJsonString(std::string_view s, std::string& out) {
  static const char kHex[] = "0123456789abcdef";
  out += '"';
  size_t i = 0;
  while (i < s.size()) {
    unsigned char c = static_cast<unsigned char>(s[i]);
    if (c == '"' || c == '\\') {
      out += '\\';
      out += static_cast<char>(c);
      ++i;
      continue;
    }
    if (c < 0x20) {
      if (c == '\n') {
        out += "\\n";
      } else if (c == '\t') {
        out += "\\t";
      } else if (c == '\r') {
        out += "\\r";
      } else {
        out += "\\u00";
        out += kHex[c >> 4];
        out += kHex[c & 15];
      }
      ++i;
      continue;
    }
    if (c < 0x80) {
      out += static_cast<char>(c);
      ++i;
      continue;
    }
    size_t len = c >= 0xF0 && c <= 0xF4 ? 4 : c >= 0xE0 ? 3 : c >= 0xC2 && c < 0xE0 ? 2 : 0;
    bool valid = len > 0 && i + len <= s.size();
    for (size_t k = 1; valid && k < len; ++k)
      valid = (static_cast<unsigned char>(s[i + k]) & 0xC0) == 0x80;
    if (valid && len == 3) {
      unsigned char c1 = static_cast<unsigned char>(s[i + 1]);
      valid = !(c == 0xE0 && c1 < 0xA0) && !(c == 0xED && c1 >= 0xA0);
    } else if (valid && len == 4) {
      unsigned char c1 = static_cast<unsigned char>(s[i + 1]);
      valid = !(c == 0xF0 && c1 < 0x90) && !(c == 0xF4 && c1 >= 0x90);
    }
    if (valid) {
      out.append(s.substr(i, len));
      i += len;
    } else {
      out += "\\u00";
      out += kHex[c >> 4];
      out += kHex[c & 15];
      ++i;
    }
  }
  out += '"';
}

void appendJsonAnnotations(const std::vector<QaxAnnotation>& list, std::string& out) {
  out += '[';
  for (size_t i = 0; i < list.size(); ++i) {
    if (i) out += ", ";
    out += "{\"key\": ";
    appendJsonString(list[i].key, out);
    out += ", \"text\": ";
    appendJsonString(list[i].text, out);
    out += '}';
  }
  out += ']';
}

void appendJsonNode(const QaxNode& node, size_t depth, std::string& out) {
  std::string pad(2 * depth + 2, ' ');
  out += "{\n" + pad + "\"name\": ";
  appendJsonString(node.name, out);
  out += ",\n" + pad + "\"kind\": \"" + (node.branch ? "branch" : "leaf") + "\",\n" + pad +
         "\"value\": ";
  appendJsonString(node.value, out);
  out += ",\n" + pad + "\"annotations\": ";
  appendJsonAnnotations(node.annotations, out);
  out += ",\n" + pad + "\"properties\": [";
  for (size_t i = 0; i < node.properties.size(); ++i) {
    const QaxProperty& p = node.properties[i];
    out += i ? ",\n" : "\n";
    out += pad + "  {\"name\": ";
    appendJsonString(p.name, out);
    out += ", \"value\": ";
    appendJsonString(p.value, out);
    out += ", \"annotations\": ";
    appendJsonAnnotations(p.annotations, out);
    out += '}';
  }
  if (!node.properties.empty()) out += "\n" + pad;
  out += "],\n" + pad + "\"children\": [";
  for (size_t i = 0; i < node.children.size(); ++i) {
    out += i ? ", " : "";
    appendJsonNode(node.children[i], depth + 1, out);
  }
  out += "]\n" + std::string(2 * depth, ' ') + "}";
}

const QaxNode* findIn(const std::vector<QaxNode>& list, std::string_view name) {
  for (const QaxNode& n : list)
    if (n.name == name) return &n;
  return nullptr;
}

}  // namespace

const QaxNode* QaxNode::findChild(std::string_view child_name) const {
  return findIn(children, child_name);
}

const QaxProperty* QaxNode::findProperty(std::string_view property_name) const {
  for (const QaxProperty& p : properties)
    if (p.name == property_name) return &p;
  return nullptr;
}

const QaxNode* QaxTree::findNode(std::string_view path) const {
  const QaxNode* node = top();
  if (!path.empty() && path.front() == '/') path.remove_prefix(1);
  while (node && !path.empty()) {
    size_t slash = path.find('/');
    node = node->findChild(path.substr(0, slash));
    path.remove_prefix(slash == std::string_view::npos ? path.size() : slash + 1);
  }
  return node;
}

const QaxProperty* QaxTree::findProperty(std::string_view path, std::string_view name) const {
  const QaxNode* node = findNode(path);
  return node ? node->findProperty(name) : nullptr;
}

const QaxBlock* QaxFile::findBlock(std::string_view type) const {
  for (const QaxBlock& b : blocks)
    if (b.type == type) return &b;
  return nullptr;
}

bool parseZxmlText(std::string_view text, QaxTree* out, std::vector<std::string>* warnings,
                   std::string* error) {
  return parseZxml(text, out, warnings, error, 0);
}

bool parseQaxImage(const uint8_t* data, size_t size, QaxFile* out, std::string* error) {
  *out = QaxFile();
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
    if (!inflateStream(dir, dir_size, &out->directory, &detail)) {
      *error = "directory at offset " + numberText(out->directory_offset) + ": " + detail;
      return false;
    }
  } else {
    out->directory.assign(reinterpret_cast<const char*>(dir), dir_size);
  }
  if (!parseDirectory(out, error)) return false;
  uint64_t snapshots = 0;
  for (QaxBlock& b : out->blocks) {
    const uint8_t* p = data + b.offset;
    size_t n = static_cast<size_t>(b.length);
    if (b.kind == QaxBlock::Kind::kRawData) {
      b.compressed = true;
      if (!inflateStream(p, n, &b.data, &detail)) {
        *error = blockWhere(b) + ": " + detail;
        return false;
      }
      continue;
    }
    if (!readTreeBlock(p, n, &b, out, error)) return false;
    if (b.tree.top()->name == "Snapshot") ++snapshots;
  }
  if (snapshots != out->snapshot_count)
    out->warnings.push_back("directory snapshotcount=" + numberText(out->snapshot_count) + " but " +
                            numberText(snapshots) + " trees have the top tag Snapshot");
  return true;
}

bool readQaxFile(const std::string& path, QaxFile* out, std::string* error) {
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
  return parseQaxImage(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size(), out, error);
}

std::string renderZxmlText(const QaxTree& tree) {
  std::string out(kZxmlHeader);
  for (const QaxNode& n : tree.nodes) renderNode(n, out);
  return out;
}

std::string renderQaxJson(const QaxFile& file) {
  std::string out =
      "{\n  \"size\": " + numberText(file.size) +
      ",\n  \"directory_offset\": " + numberText(file.directory_offset) +
      ",\n  \"byte_order\": \"" + (file.little_endian ? "little-endian" : "big-endian") +
      "\",\n  \"directory_compressed\": " + (file.directory_compressed ? "true" : "false") +
      ",\n  \"count\": " + numberText(file.count) +
      ",\n  \"snapshotcount\": " + numberText(file.snapshot_count) + ",\n  \"blocks\": [";
  for (size_t i = 0; i < file.blocks.size(); ++i) {
    const QaxBlock& b = file.blocks[i];
    out += i ? ",\n    {" : "\n    {";
    out += "\"index\": " + numberText(b.index) + ", \"type\": ";
    appendJsonString(b.type, out);
    out += ", \"offset\": " + numberText(b.offset) + ", \"length\": " + numberText(b.length);
    if (b.type == "snapshot") {
      out += ", \"timestamp\": ";
      appendJsonString(b.timestamp, out);
      out += ", \"snaptype\": ";
      appendJsonString(b.snaptype, out);
    }
    if (!b.id.empty()) {
      out += ", \"ID\": ";
      appendJsonString(b.id, out);
    }
    if (b.kind == QaxBlock::Kind::kRawData) {
      out += ", \"inflated_size\": " + numberText(b.data.size()) + "}";
      continue;
    }
    out += ",\n     \"trees\": [";
    for (size_t t = 0; t < b.tree.nodes.size(); ++t) {
      out += t ? ", " : "";
      appendJsonNode(b.tree.nodes[t], 3, out);
    }
    out += "]}";
  }
  out += file.blocks.empty() ? "]\n}\n" : "\n  ]\n}\n";
  return out;
}

}  // namespace cvn
