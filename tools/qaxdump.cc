// qaxdump: shows what a snapshot result file holds.
//   qaxdump FILE          the directory, then every block as stored
//   qaxdump --json FILE   the directory and the trees as JSON
//   qaxdump --check FILE  validates the file and prints "ok"; text that
//                         reads two ways fails it like damage
//   qaxdump --html FILE   the result as a page a person reads
//   qaxdump --diff [--all] [--json | --html] OLD NEW
//                         what changed between two results; exits as
//                         diff(1) does: 0 same, 1 changed, 2 trouble
#include <cstdio>
#include <cstring>
#include <string>

#include "qax_diff.h"
#include "qax_diff_html.h"
#include "qax_diff_text.h"
#include "qax_html.h"
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
  std::fprintf(stderr,
               "usage: qaxdump [--json | --check | --html] FILE\n"
               "       qaxdump --diff [--all] [--json | --html] OLD NEW\n");
  return 2;
}

void writeOut(const std::string& text) { std::fwrite(text.data(), 1, text.size(), stdout); }

// The name a page shows for a file: without the folders it came from.
std::string baseName(const char* path) {
  const char* slash = std::strrchr(path, '/');
  return slash && slash[1] ? slash + 1 : path;
}

// Only the plain dump shows the blocks as stored; the other views need the
// trees alone, and a stored copy of each block's text would double what a
// large result costs.
bool readOrSay(const char* path, cvn::QaxFile* file, bool keep_inflated = false) {
  std::string error;
  cvn::QaxReadOptions options;
  options.keep_inflated = keep_inflated;
  if (cvn::readQaxFile(path, file, &error, options)) return true;
  std::fprintf(stderr, "qaxdump: %s: %s\n", path, error.c_str());
  return false;
}

int runDiff(const char* old_path, const char* new_path, const char* format, bool all) {
  cvn::QaxFile old_file, new_file;
  if (!readOrSay(old_path, &old_file) || !readOrSay(new_path, &new_file)) return 2;
  cvn::QaxDiffOptions options;
  options.all = all;
  cvn::QaxDiff diff = cvn::diffQaxFiles(old_file, new_file, options);
  if (!diff.same_mac) std::fprintf(stderr, "qaxdump: %s\n", cvn::differentMacText(diff).c_str());
  if (!format) {
    writeOut(cvn::renderDiffText(diff));
  } else if (!std::strcmp(format, "--json")) {
    writeOut(cvn::renderDiffJson(diff));
  } else {
    writeOut(cvn::renderDiffHtml(diff, old_file, baseName(old_path), new_file, baseName(new_path)));
  }
  if (std::fflush(stdout) != 0 || std::ferror(stdout)) {
    std::fprintf(stderr, "qaxdump: cannot write the output\n");
    return 2;
  }
  return diff.changes.empty() ? 0 : 1;
}

}  // namespace

int main(int argc, char** argv) {
  const char* mode = nullptr;
  const char* paths[2] = {nullptr, nullptr};
  bool diff = false, all = false;
  for (int i = 1; i < argc; ++i) {
    if (!std::strcmp(argv[i], "--json") || !std::strcmp(argv[i], "--check") ||
        !std::strcmp(argv[i], "--html")) {
      if (mode) return usage();
      mode = argv[i];
    } else if (!std::strcmp(argv[i], "--diff") || !std::strcmp(argv[i], "--all")) {
      bool& flag = argv[i][2] == 'd' ? diff : all;
      if (flag) return usage();
      flag = true;
    } else if (!paths[0]) {
      paths[0] = argv[i];
    } else if (!paths[1]) {
      paths[1] = argv[i];
    } else {
      return usage();
    }
  }
  if (diff) {
    bool format_ok = !mode || std::strcmp(mode, "--check") != 0;
    if (!paths[1] || !format_ok) return usage();
    return runDiff(paths[0], paths[1], mode, all);
  }
  if (!paths[0] || paths[1] || all) return usage();
  const char* path = paths[0];
  cvn::QaxFile file;
  if (!readOrSay(path, &file, !mode)) return 1;
  if (!mode) {
    printDump(file);
  } else if (!std::strcmp(mode, "--json")) {
    writeOut(cvn::renderQaxJson(file));
  } else if (!std::strcmp(mode, "--html")) {
    writeOut(cvn::renderQaxHtml(file, baseName(path)));
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
