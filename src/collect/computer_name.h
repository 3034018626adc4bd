// The computer's own name, for when no NetBIOS name is known.
#ifndef CVN_COLLECT_COMPUTER_NAME_H_
#define CVN_COLLECT_COMPUTER_NAME_H_

#include <string>

namespace cvn {

/// On macOS the user-visible "Computer Name" (UTF-8), falling back to the
/// host name when the configuration store has none; elsewhere the host name.
std::string readComputerName();

}  // namespace cvn

#endif  // CVN_COLLECT_COMPUTER_NAME_H_
