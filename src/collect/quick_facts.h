// The handful of facts the snapshot header and the asset summary need as
// ready-made texts, read straight from the parsed profiler list.
#ifndef CVN_COLLECT_QUICK_FACTS_H_
#define CVN_COLLECT_QUICK_FACTS_H_

#include <string>
#include <string_view>

#include "collect/plist.h"

namespace cvn {

class CommandRunner;

/// Every field is empty when its key is missing.
struct QuickFacts {
  std::string local_host_name;
  /// The short account name: what "user_name" holds between "(" and ")".
  std::string user_name;
  std::string platform_uuid;
  std::string os_version;
  /// Processor packages ("packages"), "%u".
  std::string package_count;
  /// Cores ("number_processors").
  std::string processor_count;
  /// Clock speed in MHz, a whole number.
  std::string processor_speed;
  std::string processor_model;
  std::string processor_maker;
  std::string machine_model;
  std::string system_maker;
  /// Megabytes, a whole number.
  std::string physical_memory;
  /// Megabytes, a whole number.
  std::string video_memory;
  std::string main_display_resolution;
  /// The main display's EDID as the profiler prints it (hexadecimal); the
  /// asset summary decodes its diagonal.
  std::string main_display_edid;
  /// Gigabytes with one decimal: the serial-ATA disks' total size, their
  /// volumes' total size and the volumes' total free space.
  std::string disk_capacity;
  std::string volume_capacity;
  std::string volume_free;
};

/// What ioreg prints as the platform UUID; empty when it prints nothing.
/// Asked once, while collecting: the asset summary and the System section
/// both use it.
std::string readPlatformUuid(CommandRunner& runner);

/// `ioreg_uuid` (from readPlatformUuid) comes before the profiler's UUID.
QuickFacts readQuickFacts(const PlistValue& root, const std::string& ioreg_uuid);

/// The first hardware item's "serial_number"; empty when missing.
std::string readSerialNumber(const PlistValue& root);

}  // namespace cvn

#endif  // CVN_COLLECT_QUICK_FACTS_H_
