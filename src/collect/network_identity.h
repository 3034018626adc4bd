// Under which address, hardware address, workgroup and NetBIOS name this
// computer shows itself on the network, read from the parsed profiler list.
#ifndef CVN_COLLECT_NETWORK_IDENTITY_H_
#define CVN_COLLECT_NETWORK_IDENTITY_H_

#include <cstddef>
#include <string>

#include "collect/plist.h"

namespace cvn {

struct NetworkIdentity {
  /// The SMB workgroup of the active location, upper-cased; empty if none.
  std::string workgroup;
  /// Characters (UTF-16 units) of the workgroup; 0 when none was found.
  size_t workgroup_length = 0;
  /// "00-1B-63-..." form; written only when the active location knows the
  /// chosen interface, otherwise left as it was.
  std::string mac_address;
  /// As stored in the matching service's SMB settings (case kept).
  std::string netbios_name;
  /// The chosen interface's IPv4 "ConfigMethod" is exactly "Manual".
  bool manual = false;
};

/// `root` is the whole parsed profiler list (the array of data-type
/// dictionaries). When `ip` is empty the first "en" interface with an
/// address is chosen and its address is written into `ip`; otherwise the
/// interface whose first address equals `ip`. Returns the workgroup. A root
/// that is not an array, a missing data type or a key of an unexpected kind
/// reads as missing.
std::string readNetworkIdentity(const PlistValue& root, std::string& ip, NetworkIdentity* out);

}  // namespace cvn

#endif  // CVN_COLLECT_NETWORK_IDENTITY_H_
