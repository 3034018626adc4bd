// Reads snapshot result files (".qax") back: the trailer, the directory, and
// every block, inflated and, for trees, parsed. The only code of the project
// that inflates; bad input gives an error text, never a crash.
#ifndef CVN_TOOLS_QAX_READER_H_
#define CVN_TOOLS_QAX_READER_H_

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "zxml_text.h"

namespace cvn {

struct QaxBlock {
  enum class Kind { kTree, kRawData };

  // The directory entry.
  unsigned index = 0;
  std::string type;  // "snapshot", "assetinfo" or "customdata"
  uint64_t offset = 0;
  uint64_t length = 0;
  std::string timestamp;
  std::string snaptype;
  std::string id;

  Kind kind = Kind::kTree;
  bool compressed = false;
  bool split = false;
  /// The block's bytes once inflated: a tree block's text with a split
  /// block's section directory, or a raw-data block's data.
  uint64_t inflated_size = 0;
  /// Tree blocks: the ZXML text as stored (a split block's sections only).
  /// Empty unless QaxReadOptions::keep_inflated.
  std::string text;
  /// A split block's section directory, kept as `text` is.
  std::string sections;
  QaxTree tree;
  /// Raw-data blocks: the inflated bytes, kept as `text` is.
  std::string data;
};

struct QaxFile {
  uint64_t size = 0;
  uint64_t directory_offset = 0;
  bool little_endian = true;
  bool directory_compressed = false;
  std::string directory;  // the directory text, inflated
  uint64_t count = 0;
  uint64_t snapshot_count = 0;
  std::vector<QaxBlock> blocks;
  /// Oddities that do not make the file unreadable (values spanning lines).
  std::vector<std::string> warnings;
  /// Lines that another reader could take for different structure than this
  /// one does; a file the agent wrote has none.
  std::vector<std::string> ambiguities;

  /// The first block of that directory type, or null.
  const QaxBlock* findBlock(std::string_view type) const;
};

struct QaxReadOptions {
  /// What reading one file may hold, in bytes: every inflated byte counts,
  /// every byte of tree text stored plain, each line of tree text as much
  /// as the tree and the messages it can become, and a kept copy of tree
  /// text once more. Real snapshots use a few megabytes; a file that needs
  /// more fails to read, so that no file can exhaust memory.
  uint64_t budget = uint64_t{1} << 30;
  /// Keep each block's inflated bytes (`text`, `sections`, `data`) beside
  /// its tree; only a dump of the blocks as stored needs them.
  bool keep_inflated = true;
};

/// Reads and validates the whole file. On failure `error` says what is wrong
/// and where, in one line.
bool readQaxFile(const std::string& path, QaxFile* out, std::string* error,
                 const QaxReadOptions& options = QaxReadOptions());
/// The same for a file image in memory.
bool parseQaxImage(const uint8_t* data, size_t size, QaxFile* out, std::string* error,
                   const QaxReadOptions& options = QaxReadOptions());
/// Inflates one complete zlib stream that must fill `size` exactly; the
/// result is bounded to 256 MiB.
bool inflateQaxStream(const uint8_t* data, size_t size, std::string* out, std::string* error);

}  // namespace cvn

#endif  // CVN_TOOLS_QAX_READER_H_
