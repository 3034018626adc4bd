#include "zxml/trim_text.h"

namespace cvn {

std::string trimText(std::string_view text, std::string_view set, int mode) {
  if (mode & kTrimLeft) {
    while (!text.empty() && set.find(text.front()) != std::string_view::npos) text.remove_prefix(1);
  }
  if (mode & kTrimRight) {
    while (!text.empty() && set.find(text.back()) != std::string_view::npos) text.remove_suffix(1);
  }
  return std::string(text);
}

std::string firstWord(std::string_view text) {
  return trimText(text.substr(0, text.find(' ')), " \n\r", kTrimBoth);
}

}  // namespace cvn
