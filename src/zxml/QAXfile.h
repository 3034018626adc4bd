// The snapshot container: serialised trees and raw data back to back, a
// compressed INI-like directory and a 14-byte trailer ending in "QAX!".
#ifndef CVN_ZXML_QAXFILE_H_
#define CVN_ZXML_QAXFILE_H_

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "zxml/tag.h"

namespace cvn {

enum SnapshotBlockType : int { kAssetInfoBlock = 0, kSnapshotBlock = 1, kCustomDataBlock = 2 };

struct SnapshotBlock {
  SnapshotBlockType type = kSnapshotBlock;
  /// The bytes were supplied ready-made (raw data), not made from a tree.
  bool raw = false;
  bool compressed = false;
  bool split = false;
  std::vector<uint8_t> data;
  /// What the directory needs from the tree, taken when the block was made.
  std::string top_name;
  std::string timestamp;
  /// File offset, fixed while the directory is laid out.
  uint64_t offset = 0;
  uint64_t length() const { return data.size(); }
};

/// SnapshotFile::makeImage's flag for a deflated directory.
inline constexpr bool kCompressedDirectory = true;

class SnapshotFile {
 public:
  /// `little_endian` selects the byte order of the directory offset in the
  /// trailer (false: big-endian).
  explicit SnapshotFile(bool little_endian) : little_endian_(little_endian) {}

  /// Serialises `tree` now and appends it as a block of `type`.
  void addTree(const TagTree& tree, SnapshotBlockType type, BlockLayout layout,
               BlockCompression compression);
  /// Compresses `bytes` into a custom-data block (a bare zlib stream).
  void addRawData(const uint8_t* bytes, size_t length);
  /// The whole file: the blocks, the directory and the trailer. Saving it is
  /// the result directory's work (main/result_directory), which never
  /// leaves a partial file or writes through a link.
  std::vector<uint8_t> makeImage(bool compress_directory);

  /// Now, local time: "yyyyMMddHHmmss.000000" and the zone in minutes
  /// ("+180", "-300", "+0"), or "yyyy-MM-dd" for the short form.
  static std::string makeTimestamp(bool long_form);
  /// The same for the time `now` (seconds since 1970).
  static std::string makeTimestamp(bool long_form, int64_t now);

  const std::vector<std::unique_ptr<SnapshotBlock>>& blocks() const { return blocks_; }
  bool hasRawData() const { return has_raw_data_; }

 private:
  size_t measureDirectory();
  std::string writeDirectory() const;

  bool little_endian_;
  bool has_raw_data_ = false;
  std::vector<std::unique_ptr<SnapshotBlock>> blocks_;
};

}  // namespace cvn

#endif  // CVN_ZXML_QAXFILE_H_
