#include "qax_inflate.h"

#include <zlib.h>

#include <algorithm>
#include <cstring>
#include <memory>

namespace cvn {

namespace {

// Real snapshots inflate to a few megabytes; anything far beyond is a bomb.
constexpr size_t kMaxInflated = size_t{256} << 20;

std::string numberText(uint64_t n) { return std::to_string(n); }

std::string sizeText(uint64_t bytes) {
  if (bytes % (uint64_t{1} << 20) == 0) return numberText(bytes >> 20) + " MiB";
  return numberText(bytes) + " bytes";
}

}  // namespace

bool InflateBudget::take(uint64_t bytes, std::string* error) {
  if (bytes <= left_) {
    left_ -= bytes;
    return true;
  }
  left_ = 0;
  *error = "inflated data passes the budget of " + sizeText(limit_) + " for the whole file";
  return false;
}

bool inflateWithin(const uint8_t* data, size_t size, std::string* out, InflateBudget* budget,
                   std::string* error) {
  z_stream strm;
  std::memset(&strm, 0, sizeof strm);
  if (inflateInit(&strm) != Z_OK) {
    *error = "cannot start zlib";
    return false;
  }
  std::unique_ptr<z_stream, int (*)(z_stream*)> guard(&strm, inflateEnd);
  out->clear();
  const size_t kStep = 65536;
  size_t used = 0;
  strm.next_in = const_cast<Bytef*>(data);
  strm.avail_in = static_cast<uInt>(size);
  for (;;) {
    if (used >= kMaxInflated) {
      *error = "zlib stream inflates to more than " + numberText(kMaxInflated >> 20) + " MiB";
      return false;
    }
    size_t room = std::min(kStep, kMaxInflated - used);
    out->resize(used + room);
    strm.next_out = reinterpret_cast<Bytef*>(&(*out)[used]);
    strm.avail_out = static_cast<uInt>(room);
    int ret = inflate(&strm, Z_NO_FLUSH);
    used += room - strm.avail_out;
    if (budget && !budget->take(room - strm.avail_out, error)) return false;
    if (ret == Z_STREAM_END) break;
    if (ret == Z_OK) continue;
    if (ret == Z_BUF_ERROR && strm.avail_in == 0) {
      *error = "zlib stream is truncated (ends after " + numberText(size) + " bytes)";
      return false;
    }
    if (ret == Z_BUF_ERROR) {
      *error = "zlib stream makes no progress at byte " + numberText(size - strm.avail_in);
      return false;
    }
    *error = std::string("corrupt zlib stream at byte ") + numberText(size - strm.avail_in) +
             (strm.msg ? std::string(": ") + strm.msg : std::string());
    return false;
  }
  out->resize(used);
  if (strm.avail_in != 0) {
    *error = numberText(strm.avail_in) + " bytes follow the end of the zlib stream";
    return false;
  }
  return true;
}

}  // namespace cvn
