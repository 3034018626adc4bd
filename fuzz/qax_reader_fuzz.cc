// Feeds arbitrary bytes to the result-file reader, both as a whole file and,
// when they look like ZXML text, to the text parser directly; then renders
// whatever was read.
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "qax_json.h"
#include "qax_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  cvn::QaxFile file;
  std::string error;
  if (cvn::parseQaxImage(data, size, &file, &error)) {
    cvn::renderQaxJson(file);
    for (const cvn::QaxBlock& b : file.blocks)
      if (b.kind == cvn::QaxBlock::Kind::kTree) cvn::renderZxmlText(b.tree);
  }
  cvn::QaxTree tree;
  std::vector<std::string> warnings;
  std::string_view text(reinterpret_cast<const char*>(data), size);
  if (cvn::parseZxmlText(text, &tree, &warnings, &error)) {
    std::string again = cvn::renderZxmlText(tree);
    // Whatever parses must render back to the same text.
    if (again != text) __builtin_trap();
  }
  return 0;
}
