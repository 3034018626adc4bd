// The "AssetInfo" tree: the computer as an asset (names, addresses, type,
// identifiers) and a "/control/..." summary of the most-wanted facts, so a
// reader of the file need not walk the whole snapshot.
#ifndef CVN_ASSET_ASSET_INFO_H_
#define CVN_ASSET_ASSET_INFO_H_

#include <cstdint>
#include <memory>
#include <string>

#include "zxml/tag.h"

namespace cvn {

struct QuickFacts;
class SnapshotFile;

struct AssetIdentity {
  std::string workgroup;
  std::string computer_name;
  std::string netbios_name;
  /// Dash form, "00-1A-2B-3C-4D-5E".
  std::string mac_address;
  std::string serial_number;
  std::string ip;
  std::string login;
  bool manual_ip = false;
};

/// "nvtVMware", "nvtVirtualBox", "nvtParallels" or "nvtPhysical" from the
/// machine model, ignoring case.
std::string virtualTypeOf(const std::string& machine_model);

/// The asset tree of a normal scan. `snapshot` holds the finished sections;
/// `date` is the scan's long date text.
std::unique_ptr<TagTree> buildAssetInfo(bool native, const TagTree& snapshot,
                                        const std::string& date, const QuickFacts& facts,
                                        const AssetIdentity& identity);

/// The debug scan's asset tree and, beside it, the profiler's whole output as
/// a raw-data block; both are added to `file`. `date` is the long date text.
void addDebugAssetInfo(SnapshotFile& file, bool native, const std::string& host_name,
                       const std::string& date, const AssetIdentity& identity,
                       const std::string& profiler_output);

}  // namespace cvn

#endif  // CVN_ASSET_ASSET_INFO_H_
