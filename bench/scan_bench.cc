// The agent's own work from the spliced profiler document to the saved
// file, stage by stage, on generated documents of growing size (the
// argument is the number of applications; volumes are a tenth of it).
// Each stage reports items per second and, on glibc, the heap in use once
// its output exists, so linear growth and memory can be read off the table.
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <cstdio>
#include <string>

#if defined(__GLIBC__)
#include <malloc.h>
#endif

#include "../tests/fake_scan_sources.h"
#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "main/post_processor.h"
#include "main/scan_pipeline.h"
#include "zxml/QAXfile.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

double heapMegabytes() {
#if defined(__GLIBC__)
  struct mallinfo2 info = mallinfo2();
  return static_cast<double>(info.uordblks + info.hblkhd) / 1048576.0;
#else
  return 0.0;
#endif
}

void appendKey(std::string& doc, const char* key, const std::string& value) {
  doc += "\t\t\t\t<key>";
  doc += key;
  doc += "</key>\n\t\t\t\t<string>";
  doc += value;
  doc += "</string>\n";
}

std::string makeDocument(int applications) {
  const int volumes = applications / 10;
  std::string doc =
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<!DOCTYPE plist PUBLIC \"-//Apple//DTD PLIST "
      "1.0//EN\" \"http://www.apple.com/DTDs/PropertyList-1.0.dtd\">\n<plist "
      "version=\"1.0\">\n<array>\n";
  doc +=
      "\t<dict>\n\t\t<key>_dataType</key>\n\t\t<string>SPApplicationsDataType</string>\n"
      "\t\t<key>_items</key>\n\t\t<array>\n";
  for (int i = 0; i < applications; ++i) {
    doc += "\t\t\t<dict>\n";
    appendKey(doc, "_name", "Application " + std::to_string(i));
    appendKey(doc, "has64BitIntelCode", i % 3 ? "yes" : "no");
    appendKey(doc, "info", "Application " + std::to_string(i) + ", Copyright 2013 Example Inc.");
    doc += "\t\t\t\t<key>lastModified</key>\n\t\t\t\t<date>2013-11-15T20:30:00Z</date>\n";
    appendKey(doc, "path", "/Applications/Application " + std::to_string(i) + ".app");
    appendKey(doc, "runtime_environment", "arch_i386");
    appendKey(doc, "version", std::to_string(i % 7) + ".0." + std::to_string(i % 13));
    doc += "\t\t\t</dict>\n";
  }
  doc += "\t\t</array>\n\t</dict>\n";
  doc +=
      "\t<dict>\n\t\t<key>_dataType</key>\n\t\t<string>SPSerialATADataType</string>\n"
      "\t\t<key>_items</key>\n\t\t<array>\n\t\t\t<dict>\n\t\t\t\t<key>_items</key>\n"
      "\t\t\t\t<array>\n\t\t\t\t\t<dict>\n";
  appendKey(doc, "device_model", "Example Disk");
  appendKey(doc, "smart_status", "Verified");
  doc += "\t\t\t\t<key>size_in_bytes</key>\n\t\t\t\t<integer>500107862016</integer>\n";
  doc += "\t\t\t\t<key>volumes</key>\n\t\t\t\t<array>\n";
  for (int i = 0; i < volumes; ++i) {
    doc += "\t\t\t\t<dict>\n";
    appendKey(doc, "_name", "Volume " + std::to_string(i));
    appendKey(doc, "file_system", "Journaled HFS+");
    appendKey(doc, "free_space", "62,5 GB");
    doc += "\t\t\t\t<key>free_space_in_bytes</key>\n\t\t\t\t<integer>62500000000</integer>\n";
    appendKey(doc, "mount_point", "/Volumes/Volume " + std::to_string(i));
    appendKey(doc, "size", "250 GB");
    doc += "\t\t\t\t<key>size_in_bytes</key>\n\t\t\t\t<integer>250000000000</integer>\n";
    doc += "\t\t\t\t</dict>\n";
  }
  doc +=
      "\t\t\t\t</array>\n\t\t\t\t\t</dict>\n\t\t\t\t</array>\n\t\t\t</dict>\n\t\t</array>\n\t</"
      "dict>\n";
  doc += "</array>\n</plist>\n";
  return doc;
}

FakeScanSources quietMachine() {
  FakeScanSources fakes;
  fakes.runner.answer("ls -1 /Users/", "jane\n");
  return fakes;
}

void setCounters(benchmark::State& state, size_t bytes) {
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * bytes));
  state.counters["heap_MB"] = heapMegabytes();
}

void BM_Parse(benchmark::State& state) {
  std::string doc = makeDocument(static_cast<int>(state.range(0)));
  for (auto _ : state) {
    PlistValue plist;
    parsePlist(doc, &plist);
    benchmark::DoNotOptimize(plist);
  }
  setCounters(state, doc.size());
  PlistValue kept;
  parsePlist(doc, &kept);
  state.counters["heap_MB"] = heapMegabytes();
}

void BM_Convert(benchmark::State& state) {
  std::string doc = makeDocument(static_cast<int>(state.range(0)));
  PlistValue plist;
  parsePlist(doc, &plist);
  for (auto _ : state) {
    TagTree raw(true, "Macintosh");
    PlistConverter(raw).convertPlist(plist);
    benchmark::DoNotOptimize(raw);
  }
  setCounters(state, doc.size());
  TagTree kept(true, "Macintosh");
  PlistConverter(kept).convertPlist(plist);
  state.counters["heap_MB"] = heapMegabytes();
}

// The document, its property list and the raw tree, ready for the stages
// that come after conversion.
struct ConvertedDocument {
  explicit ConvertedDocument(int applications) : doc(makeDocument(applications)) {
    parsePlist(doc, &plist);
    PlistConverter(raw).convertPlist(plist);
  }
  std::string doc;
  PlistValue plist;
  TagTree raw{true, "Macintosh"};
  // The builders that gather for themselves get a quiet machine.
  FakeScanSources fakes = quietMachine();
};

void BM_PostProcess(benchmark::State& state) {
  ConvertedDocument in(static_cast<int>(state.range(0)));
  for (auto _ : state) {
    TagTree snapshot(true, "Snapshot");
    postProcess(snapshot, in.raw, false, in.fakes.runner, in.fakes.files, nullptr);
    benchmark::DoNotOptimize(snapshot);
  }
  setCounters(state, in.doc.size());
}

void BM_SerialiseAndSave(benchmark::State& state) {
  ConvertedDocument in(static_cast<int>(state.range(0)));
  TagTree snapshot(true, "Snapshot");
  postProcess(snapshot, in.raw, false, in.fakes.runner, in.fakes.files, nullptr);
  std::string path = "/tmp/cvn-scan-bench-" + std::to_string(getpid()) + ".qax";
  for (auto _ : state) {
    SnapshotFile file(true);
    file.addTree(snapshot, kSnapshotBlock, false, true);
    benchmark::DoNotOptimize(file.save(path, true));
  }
  std::remove(path.c_str());
  setCounters(state, in.doc.size());
}

// Everything after collection in one call, as the agent runs it.
void BM_ScanPipeline(benchmark::State& state) {
  std::string doc = makeDocument(static_cast<int>(state.range(0)));
  FakeScanSources fakes = quietMachine();
  for (auto _ : state) {
    ScanResult result = runScanPipeline(doc, {}, ScanRequest(), fakes.sources());
    benchmark::DoNotOptimize(result.image);
  }
  setCounters(state, doc.size());
}

BENCHMARK(BM_Parse)->Arg(2500)->Arg(5000)->Arg(10000)->Arg(20000)->Arg(40000)->Unit(
    benchmark::kMillisecond);
BENCHMARK(BM_Convert)
    ->Arg(2500)
    ->Arg(5000)
    ->Arg(10000)
    ->Arg(20000)
    ->Arg(40000)
    ->Unit(benchmark::kMillisecond);
BENCHMARK(BM_PostProcess)
    ->Arg(2500)
    ->Arg(5000)
    ->Arg(10000)
    ->Arg(20000)
    ->Arg(40000)
    ->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ScanPipeline)->Arg(2500)->Arg(10000)->Arg(40000)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SerialiseAndSave)
    ->Arg(2500)
    ->Arg(5000)
    ->Arg(10000)
    ->Arg(20000)
    ->Arg(40000)
    ->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace cvn

BENCHMARK_MAIN();
