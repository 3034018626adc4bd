// The volumes already written under Storage/Logical-disks. A volume can be
// listed by its disk, again among the mounted volumes of today's profilers
// and again under its USB device; the disk builder and the USB builder share
// one of these so that each volume is written once.
#ifndef CVN_SECTIONS_WRITTEN_VOLUMES_H_
#define CVN_SECTIONS_WRITTEN_VOLUMES_H_

#include <functional>
#include <set>
#include <string>

#include "zxml/tag.h"

namespace cvn {

class WrittenVolumes {
 public:
  /// True when a volume of the raw tree with the same device name
  /// ("bsd_name") or mount point ("mount_point") was written.
  bool holds(const Tag& volume) const;
  /// Records the raw tree's `volume` as written.
  void add(const Tag& volume);

 private:
  std::set<std::string, std::less<>> bsd_names_;
  std::set<std::string, std::less<>> mount_points_;
};

}  // namespace cvn

#endif  // CVN_SECTIONS_WRITTEN_VOLUMES_H_
