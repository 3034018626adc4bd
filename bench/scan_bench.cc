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
#include "main/result_directory.h"
#include "main/scan_pipeline.h"
#include "profiler_document.h"
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
    Plist plist;
    parsePlist(doc, &plist);
    benchmark::DoNotOptimize(plist);
  }
  setCounters(state, doc.size());
  Plist kept;
  parsePlist(doc, &kept);
  state.counters["heap_MB"] = heapMegabytes();
}

void BM_Convert(benchmark::State& state) {
  std::string doc = makeDocument(static_cast<int>(state.range(0)));
  Plist plist;
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
  Plist plist;
  TagTree raw{true, "Macintosh"};
  // The builders that gather for themselves get a quiet machine.
  FakeScanSources fakes = quietMachine();
};

void BM_PostProcess(benchmark::State& state) {
  ConvertedDocument in(static_cast<int>(state.range(0)));
  for (auto _ : state) {
    TagTree snapshot(true, "Snapshot");
    postProcess(snapshot, in.raw, SectionSources{in.fakes.runner, in.fakes.files, ""}, nullptr);
    benchmark::DoNotOptimize(snapshot);
  }
  setCounters(state, in.doc.size());
}

void BM_SerialiseAndSave(benchmark::State& state) {
  ConvertedDocument in(static_cast<int>(state.range(0)));
  TagTree snapshot(true, "Snapshot");
  postProcess(snapshot, in.raw, SectionSources{in.fakes.runner, in.fakes.files, ""}, nullptr);
  // Saved as the agent saves, so the disk's part is counted too.
  WorkingDirectory directory("/tmp");
  std::string path = "/tmp/cvn-scan-bench-" + std::to_string(getpid()) + ".qax";
  for (auto _ : state) {
    SnapshotFile file(true);
    file.addTree(snapshot, kSnapshotBlock, kWholeText, kCompressed);
    if (directory.writeFile(path, file.makeImage(kCompressedDirectory)) != SaveOutcome::kSaved) {
      state.SkipWithError("cannot save in /tmp");
      break;
    }
    state.PauseTiming();
    std::remove(path.c_str());
    state.ResumeTiming();
  }
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
