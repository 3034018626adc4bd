#if defined(__APPLE__)

#include <CoreFoundation/CoreFoundation.h>
#include <SystemConfiguration/SystemConfiguration.h>
#include <unistd.h>

#include <vector>

#include "collect/computer_name.h"

namespace cvn {

namespace {

std::string hostName() {
  char name[256] = {};
  if (gethostname(name, sizeof name - 1) != 0) return std::string();
  return name;
}

}  // namespace

std::string readComputerName() {
  CFStringRef name = SCDynamicStoreCopyComputerName(nullptr, nullptr);
  // Newer systems may refuse the store to an unentitled caller.
  if (!name) return hostName();
  std::string text;
  CFIndex length = CFStringGetLength(name);
  CFIndex capacity = CFStringGetMaximumSizeForEncoding(length, kCFStringEncodingUTF8) + 1;
  std::vector<char> buffer(static_cast<size_t>(capacity));
  if (CFStringGetCString(name, buffer.data(), capacity, kCFStringEncodingUTF8))
    text = buffer.data();
  CFRelease(name);
  return text.empty() ? hostName() : text;
}

}  // namespace cvn

#endif  // defined(__APPLE__)
