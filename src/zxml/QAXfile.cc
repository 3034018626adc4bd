#include "zxml/QAXfile.h"

#include <cstdio>
#include <ctime>

#include "zxml/date_text.h"
#include "zxml/format_text.h"
#include "zxml/tag.h"
#include "zxml/zXML.h"

namespace cvn {

namespace {

constexpr size_t kTrailerLength = 14;

int countSnapshots(const std::vector<std::unique_ptr<SnapshotBlock>>& blocks) {
  int count = 0;
  for (const auto& b : blocks)
    if (!b->raw && b->top_name == "Snapshot") ++count;
  return count;
}

}  // namespace

void SnapshotFile::addTree(const TagTree& tree, SnapshotBlockType type, BlockLayout layout,
                           BlockCompression compression) {
  auto block = std::make_unique<SnapshotBlock>();
  block->type = type;
  block->compressed = compression == kCompressed;
  block->split = layout == kSplitSections;
  block->data = tree.serialise(compression, layout);
  const Tag& top = tree.top();
  block->top_name = top.name();
  const TagProperty* stamp = top.findProperty("timestamp");
  if (stamp && stamp->value().isText()) block->timestamp = stamp->value().text();
  blocks_.push_back(std::move(block));
}

void SnapshotFile::addRawData(const uint8_t* bytes, size_t length) {
  auto block = std::make_unique<SnapshotBlock>();
  block->type = kCustomDataBlock;
  block->raw = true;
  block->compressed = true;
  block->split = true;
  block->data = compressLevel9(bytes, length, kQaxFileModule);
  blocks_.push_back(std::move(block));
  has_raw_data_ = true;
}

// The 32-bit set of the directory lines: it sizes the directory and fixes
// every block's offset on the way.
size_t SnapshotFile::measureDirectory() {
  size_t size = measureFormat("[H]\ncount=%u\nsnapshotcount=%d\n",
                              static_cast<unsigned>(blocks_.size()), countSnapshots(blocks_));
  uint64_t offset = 0;
  int index = 0;
  for (auto& b : blocks_) {
    b->offset = offset;
    unsigned o = static_cast<unsigned>(b->offset);
    unsigned l = static_cast<unsigned>(b->length());
    switch (b->type) {
      case kAssetInfoBlock:
        size += measureFormat("[%d]\noffset=%u\nlength=%u\ntype=assetinfo\n", index, o, l);
        break;
      case kSnapshotBlock:
        size += measureFormat("[%d]\noffset=%u\nlength=%u\ntype=%s\ntimestamp=%s\nsnaptype=mac:1\n",
                              index, o, l, "snapshot", b->timestamp.c_str());
        break;
      case kCustomDataBlock:
        size +=
            measureFormat("[%d]\noffset=%u\nlength=%u\ntype=customdata\nID=rawdata\n", index, o, l);
        break;
      default:
        break;
    }
    offset += b->length();
    ++index;
  }
  return size;
}

std::string SnapshotFile::writeDirectory() const {
  std::string text;
  char line[128];
  std::snprintf(line, sizeof line, "[H]\ncount=%lu\nsnapshotcount=%d\n",
                static_cast<unsigned long>(blocks_.size()), countSnapshots(blocks_));
  text += line;
  int index = 0;
  for (const auto& b : blocks_) {
    unsigned long o = static_cast<unsigned long>(b->offset);
    unsigned long l = static_cast<unsigned long>(b->length());
    switch (b->type) {
      case kAssetInfoBlock:
        std::snprintf(line, sizeof line, "[%d]\noffset=%lu\nlength=%lu\ntype=assetinfo\n", index, o,
                      l);
        text += line;
        break;
      case kSnapshotBlock:
        // The timestamp is caller text of any length; it is appended, not
        // formatted into the fixed line buffer.
        std::snprintf(line, sizeof line, "[%d]\noffset=%lu\nlength=%lu\ntype=%s\ntimestamp=", index,
                      o, l, "snapshot");
        text += line;
        text += b->timestamp;
        text += "\nsnaptype=mac:1\n";
        break;
      case kCustomDataBlock:
        std::snprintf(line, sizeof line,
                      "[%d]\noffset=%lu\nlength=%lu\ntype=customdata\nID=rawdata\n", index, o, l);
        text += line;
        break;
      default:
        break;
    }
    ++index;
  }
  return text;
}

std::vector<uint8_t> SnapshotFile::makeImage(bool compress_directory) {
  size_t directory_size = measureDirectory();
  uint64_t blocks_size = 0;
  for (const auto& b : blocks_) blocks_size += b->length();
  std::vector<uint8_t> image;
  image.reserve(blocks_size + directory_size + kTrailerLength + 1);
  for (const auto& b : blocks_) image.insert(image.end(), b->data.begin(), b->data.end());

  // Written with the full-width set; on files beyond 4 GiB it is longer than
  // measured, and the text written is what counts.
  std::string directory = writeDirectory();
  const uint8_t* dir_bytes = reinterpret_cast<const uint8_t*>(directory.data());
  if (compress_directory) {
    std::vector<uint8_t> packed = compressLevel9(dir_bytes, directory.size(), kQaxFileModule);
    image.insert(image.end(), packed.begin(), packed.end());
  } else {
    image.insert(image.end(), dir_bytes, dir_bytes + directory.size());
  }

  uint64_t d = blocks_size;
  for (int i = 0; i < 8; ++i) {
    int shift = little_endian_ ? 8 * i : 8 * (7 - i);
    image.push_back(static_cast<uint8_t>(d >> shift));
  }
  image.push_back(0x03);
  image.push_back(compress_directory ? 0x01 : 0x00);
  image.insert(image.end(), {'Q', 'A', 'X', '!'});
  return image;
}

std::string SnapshotFile::makeTimestamp(bool long_form) {
  return makeTimestamp(long_form, static_cast<int64_t>(std::time(nullptr)));
}

std::string SnapshotFile::makeTimestamp(bool long_form, int64_t now) {
  return formatLocalDate(now, long_form);
}

}  // namespace cvn
