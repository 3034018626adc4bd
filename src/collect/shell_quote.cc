#include "collect/shell_quote.h"

namespace cvn {

std::string escapeForDoubleQuotes(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  for (char c : text) {
    if (c == '$' || c == '`' || c == '"' || c == '\\') out += '\\';
    out += c;
  }
  return out;
}

std::string shellQuote(std::string_view text) {
  bool safe = !text.empty();
  for (char c : text) {
    bool ok = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9');
    for (char s : std::string_view("_./:@%+,=-"))
      if (c == s) ok = true;
    if (!ok) {
      safe = false;
      break;
    }
  }
  if (safe) return std::string(text);
  std::string out = "'";
  for (char c : text) {
    if (c == '\'') {
      out += "'\\''";
    } else {
      out += c;
    }
  }
  out += '\'';
  return out;
}

}  // namespace cvn
