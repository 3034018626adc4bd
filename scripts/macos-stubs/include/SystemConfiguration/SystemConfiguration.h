// Stand-in for Apple's SystemConfiguration header, used only by
// scripts/build-macos.sh (see CoreFoundation/CoreFoundation.h beside it).
#ifndef CVN_MACOS_STUB_SYSTEMCONFIGURATION_H_
#define CVN_MACOS_STUB_SYSTEMCONFIGURATION_H_

#include <CoreFoundation/CoreFoundation.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef const struct __SCDynamicStore* SCDynamicStoreRef;

CFStringRef SCDynamicStoreCopyComputerName(SCDynamicStoreRef store,
                                           CFStringEncoding* name_encoding);

#ifdef __cplusplus
}
#endif

#endif  // CVN_MACOS_STUB_SYSTEMCONFIGURATION_H_
