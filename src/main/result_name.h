// The result file's name: the host and the MAC address of the scanned
// machine, made safe to use as one name in the working directory.
#ifndef CVN_MAIN_RESULT_NAME_H_
#define CVN_MAIN_RESULT_NAME_H_

#include <cstddef>
#include <string>

namespace cvn {

/// The file system's limit for one name, in bytes.
inline constexpr size_t kMaxFileNameLength = 255;

struct ResultName {
  std::string host;
  std::string address;

  /// "HOST_ADDR.qax" for counter 0, "HOST_ADDR(N).qax" for N from 1 on.
  std::string fileName(int counter) const;
};

/// The host part is upper-cased; in both parts "/", NUL and control bytes
/// become "_", so the name stays one name in one directory and one line on
/// the console; a leading "." becomes "_" (a hidden file is not a result).
/// The host part is then cut on a UTF-8 boundary so that the name fits
/// kMaxFileNameLength bytes with any counter; the address part only if it
/// alone could not fit.
ResultName makeResultName(const std::string& host, const std::string& mac_address);

}  // namespace cvn

#endif  // CVN_MAIN_RESULT_NAME_H_
