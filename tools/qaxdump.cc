// qaxdump: shows what a snapshot result file holds.
//   qaxdump FILE          the directory, then every block as stored
//   qaxdump --json FILE   the directory and the trees as JSON
//   qaxdump --check FILE  validates the file and prints "ok"; text that
//                         reads two ways fails it like damage
#include <cstdio>
#include <cstring>
#include <string>

#include "qax_json.h"
#include "qax_reader.h"

namespace {

void printDump(const cvn::QaxFile& file) {
  std::printf("size=%llu directory-offset=%llu byte-order=%s directory-compressed=%d\n",
              static_cast<unsigned long long>(file.size),
              static_cast<unsigned long long>(file.directory_offset),
              file.little_endian ? "little-endian" : "big-endian",
              file.directory_compressed ? 1 : 0);
  std::fwrite(file.directory.data(), 1, file.directory.size(), stdout);
  for (const cvn::QaxBlock& b : file.blocks) {
    std::printf("== block %u: type=%s offset=%llu length=%llu\n", b.index, b.type.c_str(),
                static_cast<unsigned long long>(b.offset),
                static_cast<unsigned long long>(b.length));
    if (b.kind == cvn::QaxBlock::Kind::kTree) {
      std::fwrite(b.text.data(), 1, b.text.size(), stdout);
      if (b.split) std::fwrite(b.sections.data(), 1, b.sections.size(), stdout);
      continue;
    }
    std::printf("raw data, %zu bytes inflated; first bytes:\n", b.data.size());
    size_t shown = b.data.size() < 64 ? b.data.size() : 64;
    for (size_t row = 0; row < shown; row += 16) {
      std::string ascii;
      for (size_t i = row; i < row + 16; ++i) {
        if (i < shown) {
          unsigned char c = static_cast<unsigned char>(b.data[i]);
          std::printf("%02x ", c);
          ascii += c >= 0x20 && c < 0x7f ? static_cast<char>(c) : '.';
        } else {
          std::printf("   ");
        }
      }
      std::printf(" |%s|\n", ascii.c_str());
    }
  }
}

int usage() {
  std::fprintf(stderr, "usage: qaxdump [--json | --check] FILE\n");
  return 2;
}

}  // namespace

int main(int argc, char** argv) {
  const char* mode = nullptr;
  const char* path = nullptr;
  for (int i = 1; i < argc; ++i) {
    if (!std::strcmp(argv[i], "--json") || !std::strcmp(argv[i], "--check")) {
      if (mode) return usage();
      mode = argv[i];
    } else if (!path) {
      path = argv[i];
    } else {
      return usage();
    }
  }
  if (!path) return usage();
  cvn::QaxFile file;
  std::string error;
  // Only the dump shows the blocks as stored; the others need the trees.
  cvn::QaxReadOptions options;
  options.keep_inflated = !mode;
  if (!cvn::readQaxFile(path, &file, &error, options)) {
    std::fprintf(stderr, "qaxdump: %s: %s\n", path, error.c_str());
    return 1;
  }
  if (!mode) {
    printDump(file);
  } else if (!std::strcmp(mode, "--json")) {
    std::string json = cvn::renderQaxJson(file);
    std::fwrite(json.data(), 1, json.size(), stdout);
  } else {
    // Text that reads two ways is as bad as damage: what an importer sees
    // would depend on how it reads.
    if (!file.ambiguities.empty()) {
      std::fprintf(stderr, "qaxdump: %s: %s\n", path, file.ambiguities.front().c_str());
      return 1;
    }
    for (const std::string& w : file.warnings)
      std::fprintf(stderr, "qaxdump: %s: warning: %s\n", path, w.c_str());
    std::printf("ok\n");
  }
  return 0;
}
