#include "sections/volume_fields.h"

#include <string>
#include <string_view>

#include "sections/builder_util.h"
#include "zxml/size_text.h"

namespace cvn {
namespace {

struct SizeReading {
  double gigabytes = 0.0;
  int64_t bytes = 0;
};

// Only an integer byte count is trusted; otherwise the profiler's own size
// text is converted, keeping its fraction.
SizeReading readVolumeSize(const Tag& volume, std::string_view bytes_key,
                           std::string_view text_key) {
  SizeReading reading;
  const TagValue* bytes = rawValue(volume, bytes_key);
  if (bytes && bytes->isInt()) {
    reading.bytes = bytes->asInt();
    reading.gigabytes = bytesToDecimalGigabytes(reading.bytes);
  } else {
    std::string_view text = rawText(volume, text_key);
    reading.gigabytes = SizeText::toDecimalGigabytes(text, false);
    reading.bytes = SizeText::toBytes(text);
  }
  return reading;
}

void writeSize(Tag& partition, std::string_view field, const SizeReading& reading) {
  std::string base = formatText("%lld", static_cast<long long>(reading.bytes));
  partition.setProperty(field, TagValue(reading.gigabytes), "base-value", base.c_str());
}

}  // namespace

double bytesToDecimalGigabytes(int64_t bytes) {
  return static_cast<double>(bytes) / 1000 / 10000000 * 10;
}

int64_t rawBytes(const TagValue& value) { return value.isInt() ? value.asInt() : 0; }

void writeFileSystem(Tag& partition, const Tag& volume) {
  if (hasKey(volume, "file_system")) {
    partition.setProperty("file-sys", TagValue(rawText(volume, "file_system")));
  }
}

namespace {

// The old layout writes a size only beside its text; today's mounted volumes
// may carry the byte count alone.
VolumeSpace writeSpace(Tag& partition, const Tag& volume, bool bytes_alone_count) {
  VolumeSpace space;
  auto present = [&](const char* bytes_key, const char* text_key) {
    return hasKey(volume, text_key) || (bytes_alone_count && hasKey(volume, bytes_key));
  };
  if (present("size_in_bytes", "size")) {
    SizeReading total = readVolumeSize(volume, "size_in_bytes", "size");
    space.total_gb = total.gigabytes;
    writeSize(partition, "size", total);
  }
  if (present("free_space_in_bytes", "free_space")) {
    SizeReading free = readVolumeSize(volume, "free_space_in_bytes", "free_space");
    space.free_known = true;
    space.free_gb = free.gigabytes;
    writeSize(partition, "free", free);
  }
  return space;
}

}  // namespace

VolumeSpace writeVolumeSpace(Tag& partition, const Tag& volume) {
  return writeSpace(partition, volume, false);
}

VolumeSpace writeMountedVolumeSpace(Tag& partition, const Tag& volume) {
  return writeSpace(partition, volume, true);
}

void writeUsedPercent(Tag& partition, const VolumeSpace& space) {
  if (!space.free_known || space.total_gb == 0.0) return;
  double used = space.total_gb - space.free_gb;
  double percent = used / space.total_gb * 100;
  if (!(percent > -9.2e18 && percent < 9.2e18)) return;
  TagProperty& prop = partition.setProperty("used%", TagValue(truncateToInt64(percent)), "pos",
                                            formatText("%.2lf", used).c_str());
  prop.addAnnotation("max", formatText("%.2lf", space.total_gb));
  prop.addAnnotation("val-units", "GB");
}

}  // namespace cvn
