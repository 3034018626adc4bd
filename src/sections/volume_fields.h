// Volume fields shared by the disk builder and the USB builder, whose
// removable volumes must read exactly like the internal ones: sizes in
// decimal gigabytes with the byte count beside them, and the used share.
#ifndef CVN_SECTIONS_VOLUME_FIELDS_H_
#define CVN_SECTIONS_VOLUME_FIELDS_H_

#include <cstdint>

#include "sections/builder_util.h"
#include "zxml/tag.h"

namespace cvn {

/// Bytes / 10^9 as a double.
double bytesToDecimalGigabytes(int64_t bytes);

/// A raw byte count: an integer value as is, a value of any other kind as 0.
int64_t rawBytes(const TagValue& value);

/// What writeUsedPercent needs from writeVolumeSpace.
struct VolumeSpace {
  double total_gb = 0.0;
  bool free_known = false;
  double free_gb = 0.0;
};

/// Sets "file-sys" to the text of "file_system" when the volume has that key.
void writeFileSystem(Tag& partition, const Tag& volume);

/// Sets "size" (from "size_in_bytes", else the "size" text) and "free" (from
/// "free_space_in_bytes", else the "free_space" text), each a floating-point
/// number of decimal gigabytes annotated "base-value" with the bytes, for
/// the keys the volume has.
VolumeSpace writeVolumeSpace(Tag& partition, const Tag& volume);

/// The same for the mounted volumes of today's profilers, which may give
/// only the byte counts ("size_in_bytes", "free_space_in_bytes") without
/// the size texts.
VolumeSpace writeMountedVolumeSpace(Tag& partition, const Tag& volume);

/// Sets "used%" (truncated percentage) annotated "pos", "max" and "val-units"
/// when the free space is known. Nothing is written when the percentage is
/// not a number in range, which covers a volume whose total is zero.
void writeUsedPercent(Tag& partition, const VolumeSpace& space);

}  // namespace cvn

#endif  // CVN_SECTIONS_VOLUME_FIELDS_H_
