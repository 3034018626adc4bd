// The section builders, one per file, called in order by the post-processing
// pipeline. Each reads the raw "Macintosh" tree (never changing it) and adds
// its section under the snapshot's top tag. None reports a status: missing
// data means a missing section, record or field.
#ifndef CVN_SECTIONS_SECTIONS_H_
#define CVN_SECTIONS_SECTIONS_H_

#include <string_view>

#include "zxml/tag.h"

namespace cvn {

class CommandRunner;
class FileSystem;
class WrittenVolumes;

/// "System": computer system, chassis, memory slots, power management.
/// `ioreg_uuid` stands in for a missing profiler UUID.
void buildSystemSection(TagTree& snapshot, const TagTree& raw, std::string_view ioreg_uuid);
/// "Processors".
void buildProcessorsSection(TagTree& snapshot, const TagTree& raw);
/// "Memory".
void buildMemorySection(TagTree& snapshot, const TagTree& raw);
/// "Video": video adapters and monitors with EDID decoding.
void buildDisplaysSection(TagTree& snapshot, const TagTree& raw);
/// "Storage": physical disks, drives and volumes; each volume written is
/// added to `written`.
void buildStorageSection(TagTree& snapshot, const TagTree& raw, WrittenVolumes& written);
/// "Network"/"Adapters".
void buildNetworkAdaptersSection(TagTree& snapshot, const TagTree& raw);
/// "Peripherals": printers and scanners.
void buildPrintersSection(TagTree& snapshot, const TagTree& raw);
/// USB devices and removable media; volumes in `written` are not written again.
void buildUsbSection(TagTree& snapshot, const TagTree& raw, CommandRunner& runner,
                     WrittenVolumes& written);
/// "OS".
void buildOperatingSystemSection(TagTree& snapshot, const TagTree& raw);
/// "User-accounts", from `ls` and `dscl`.
void buildUsersSection(TagTree& snapshot, CommandRunner& runner);
/// "Software": applications.
void buildApplicationsSection(TagTree& snapshot, const TagTree& raw);
/// "InternetPlug-Ins" and "Libraries" under "Software".
void buildPlugInsSection(TagTree& snapshot, FileSystem& fs, CommandRunner& runner);
/// "Processes": a copy of the raw tree's process list.
void buildProcessesSection(TagTree& snapshot, const TagTree& raw);
/// "Environment", from `env`.
void buildEnvironmentSection(TagTree& snapshot, CommandRunner& runner);
/// "Security"/"Firewall".
void buildFirewallSection(TagTree& snapshot, const TagTree& raw);

}  // namespace cvn

#endif  // CVN_SECTIONS_SECTIONS_H_
