// A whole scan after collection, on whatever bytes the profiler printed:
// reader, converter, quick facts, identity, the fifteen builders on a quiet
// machine, the asset tree and the container, which the inspector must read.
#include <cstddef>
#include <cstdint>
#include <string>

#include "../tests/fake_scan_sources.h"
#include "main/scan_pipeline.h"
#include "qax_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  cvn::FakeScanSources fakes;
  fakes.runner.answer("ls -1 /Users/", "jane\n");
  std::string document(reinterpret_cast<const char*>(data), size);
  cvn::ScanResult result =
      cvn::runScanPipeline(std::move(document), {}, cvn::ScanRequest(), fakes.sources());
  cvn::QaxFile file;
  std::string error;
  if (!cvn::parseQaxImage(result.image.data(), result.image.size(), &file, &error))
    __builtin_trap();
  return 0;
}
