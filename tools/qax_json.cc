#include "qax_json.h"

#include <string>

#include "zxml/utf8_text.h"

namespace cvn {

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
    uint32_t code_point = 0;
    size_t len = utf8SequenceLength(reinterpret_cast<const unsigned char*>(s.data()) + i,
                                    s.size() - i, &code_point);
    if (len > 0) {
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

namespace {

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

}  // namespace

std::string renderQaxJson(const QaxFile& file) {
  std::string out =
      "{\n  \"size\": " + std::to_string(file.size) +
      ",\n  \"directory_offset\": " + std::to_string(file.directory_offset) +
      ",\n  \"byte_order\": \"" + (file.little_endian ? "little-endian" : "big-endian") +
      "\",\n  \"directory_compressed\": " + (file.directory_compressed ? "true" : "false") +
      ",\n  \"count\": " + std::to_string(file.count) +
      ",\n  \"snapshotcount\": " + std::to_string(file.snapshot_count) + ",\n  \"blocks\": [";
  for (size_t i = 0; i < file.blocks.size(); ++i) {
    const QaxBlock& b = file.blocks[i];
    out += i ? ",\n    {" : "\n    {";
    out += "\"index\": " + std::to_string(b.index) + ", \"type\": ";
    appendJsonString(b.type, out);
    out +=
        ", \"offset\": " + std::to_string(b.offset) + ", \"length\": " + std::to_string(b.length);
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
      out += ", \"inflated_size\": " + std::to_string(b.inflated_size) + "}";
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
