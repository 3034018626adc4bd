// Feeds two trees made of arbitrary bytes (the input split at its first NUL)
// to the diff and the pages, and checks that the escaping leaves nothing a
// terminal or a browser would take for a command.
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "html_page.h"
#include "qax_diff.h"
#include "qax_diff_html.h"
#include "qax_diff_text.h"
#include "qax_html.h"
#include "utf8_text.h"

namespace {

cvn::QaxFile resultOf(std::string_view text, const char* type) {
  cvn::QaxFile file;
  file.blocks.emplace_back();
  file.blocks.back().type = type;
  std::string error;
  if (!cvn::parseZxmlText(text, &file.blocks.back().tree, nullptr, &error, 1)) file.blocks.clear();
  return file;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  std::string_view input(reinterpret_cast<const char*>(data), size);
  size_t cut = input.find('\0');
  std::string_view first = input.substr(0, cut);
  std::string_view second = cut == std::string_view::npos ? first : input.substr(cut + 1);
  const char* type = size % 2 ? "snapshot" : "assetinfo";
  cvn::QaxFile old_file = resultOf(first, type), new_file = resultOf(second, type);
  for (bool all : {false, true}) {
    cvn::QaxDiffOptions options;
    options.all = all;
    cvn::QaxDiff diff = cvn::diffQaxFiles(old_file, new_file, options);
    cvn::renderDiffText(diff);
    cvn::renderDiffJson(diff);
    cvn::renderDiffHtml(diff, old_file, first, new_file, second);
  }
  cvn::renderQaxHtml(new_file, second);
  for (char c : cvn::htmlText(input))
    if (c == '<' || c == '>' || c == '"' || c == '\'' || c == '\0') __builtin_trap();
  for (char c : cvn::terminalText(input, true)) {
    unsigned char u = static_cast<unsigned char>(c);
    if (u < 0x20 || u == 0x7F) __builtin_trap();
  }
  return 0;
}
