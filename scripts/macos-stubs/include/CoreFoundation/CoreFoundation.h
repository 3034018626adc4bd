// Stand-in for Apple's CoreFoundation header, used only by
// scripts/build-macos.sh to compile and link the agent for macOS on Linux,
// where no SDK is at hand. It declares just the calls the agent makes, with
// the signatures and constants Apple documents; a Mac build uses the real
// header. Add a declaration here when a *_darwin.cc file starts using one.
#ifndef CVN_MACOS_STUB_COREFOUNDATION_H_
#define CVN_MACOS_STUB_COREFOUNDATION_H_

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef unsigned char Boolean;
typedef signed long CFIndex;
typedef uint32_t CFStringEncoding;
typedef const void* CFTypeRef;
typedef const struct __CFString* CFStringRef;
typedef const struct __CFAllocator* CFAllocatorRef;

enum { kCFStringEncodingUTF8 = 0x08000100 };

CFIndex CFStringGetLength(CFStringRef the_string);
CFIndex CFStringGetMaximumSizeForEncoding(CFIndex length, CFStringEncoding encoding);
Boolean CFStringGetCString(CFStringRef the_string, char* buffer, CFIndex buffer_size,
                           CFStringEncoding encoding);
void CFRelease(CFTypeRef cf);

#ifdef __cplusplus
}
#endif

#endif  // CVN_MACOS_STUB_COREFOUNDATION_H_
