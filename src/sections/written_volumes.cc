#include "sections/written_volumes.h"

#include <string_view>

#include "sections/builder_util.h"

namespace cvn {

bool WrittenVolumes::holds(const Tag& volume) const {
  std::string_view bsd_name = rawText(volume, "bsd_name");
  std::string_view mount_point = rawText(volume, "mount_point");
  return (!bsd_name.empty() && bsd_names_.count(bsd_name)) ||
         (!mount_point.empty() && mount_points_.count(mount_point));
}

void WrittenVolumes::add(const Tag& volume) {
  std::string_view bsd_name = rawText(volume, "bsd_name");
  std::string_view mount_point = rawText(volume, "mount_point");
  if (!bsd_name.empty()) bsd_names_.emplace(bsd_name);
  if (!mount_point.empty()) mount_points_.emplace(mount_point);
}

}  // namespace cvn
