#include "main/result_name.h"

#include <climits>

#include "zxml/utf8_text.h"

namespace cvn {
namespace {

// "_", and the longest counter with the extension: "(2147483647).qax".
const size_t kFixedPart = 1 + std::to_string(INT_MAX).size() + 2 + 4;

std::string safePart(const std::string& text, bool upper) {
  std::string part;
  part.reserve(text.size());
  for (char c : text) {
    unsigned char u = static_cast<unsigned char>(c);
    if (c == '/' || u < 0x20 || u == 0x7F)
      c = '_';
    else if (upper && c >= 'a' && c <= 'z')
      c = static_cast<char>(c - 'a' + 'A');
    part += c;
  }
  return part;
}

// Cuts before `limit`, backing off to the start of a UTF-8 sequence the
// limit would split: macOS refuses names that are not UTF-8.
void cutAt(std::string& text, size_t limit) { text.resize(utf8CutLength(text, limit)); }

}  // namespace

std::string ResultName::fileName(int counter) const {
  std::string name = host + "_" + address;
  if (counter > 0) name += "(" + std::to_string(counter) + ")";
  return name + ".qax";
}

ResultName makeResultName(const std::string& host, const std::string& mac_address) {
  ResultName name;
  name.host = safePart(host, true);
  if (!name.host.empty() && name.host.front() == '.') name.host.front() = '_';
  std::string address;
  for (char c : mac_address)
    if (c != '-') address += c;
  name.address = safePart(address, false);
  const size_t room = kMaxFileNameLength - kFixedPart;
  cutAt(name.address, room);
  cutAt(name.host, room - name.address.size());
  return name;
}

}  // namespace cvn
