#include "collect/processor_text.h"

#include <cmath>
#include <cstdlib>

#include "zxml/trim_text.h"

namespace cvn {

std::optional<int64_t> coreCountOfProcText(std::string_view text) {
  constexpr std::string_view kPrefix = "proc ";
  if (text.substr(0, kPrefix.size()) != kPrefix) return std::nullopt;
  text.remove_prefix(kPrefix.size());
  int fields = 0;
  int64_t total = 0;
  while (true) {
    size_t end = text.find(':');
    std::string_view field = text.substr(0, end);
    // Nine digits keep the sum far from overflow; no chip has that many cores.
    if (field.empty() || field.size() > 9) return std::nullopt;
    int64_t value = 0;
    for (char c : field) {
      if (c < '0' || c > '9') return std::nullopt;
      value = value * 10 + (c - '0');
    }
    if (fields++ == 0) total = value;
    if (end == std::string_view::npos) break;
    text.remove_prefix(end + 1);
  }
  if (fields < 3 || fields > 4) return std::nullopt;
  return total;
}

int64_t megahertzOfSpeedText(std::string_view text) {
  std::string number = firstWord(text);
  for (char& c : number)
    if (c == ',') c = '.';
  double megahertz = std::strtod(number.c_str(), nullptr);
  if (text.find("MHz") == std::string_view::npos) megahertz *= 1000;
  // Rounded, not cut: 2.01 x 1000 is 2009.99... in binary floating point.
  if (!(megahertz >= 0 && megahertz < 1e15)) return 0;
  return std::llround(megahertz);
}

std::string processorMakerOf(std::string_view model) {
  if (model.find("Intel") != std::string_view::npos) return "GenuineIntel";
  if (model.substr(0, 5) == "Apple") return "Apple Inc.";
  return std::string();
}

}  // namespace cvn
