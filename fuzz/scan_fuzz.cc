// A whole scan after collection, on whatever bytes the tools printed: the
// property-list reader, the converter, quick facts and identity, the fifteen
// builders, the asset tree and the container. The inspector must read the
// file back, find nothing that reads two ways, and get every name, value
// and annotation back exactly as the dump's escaping says it wrote them.
//
// Input: the profiler's document, then optionally a NUL byte and the text
// that every other tool prints (dscl, diskutil, ioreg, ps, env; also the
// one process's short name), so collected text reaches the builders from
// both sides.
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

#include "../tests/fake_scan_sources.h"
#include "main/scan_pipeline.h"
#include "qax_reader.h"
#include "zxml/zXML.h"

namespace {

class ToolsPrint : public cvn::FakeCommandRunner {
 public:
  explicit ToolsPrint(std::string text) : text_(std::move(text)) {}
  cvn::ToolOutput respond(const std::string& command) override {
    // One user, so the users section asks dscl once and never loops on an
    // empty listing.
    return {command == "ls -1 /Users/" ? std::string("jane\n") : text_, false};
  }

 private:
  std::string text_;
};

bool same(const std::string& read, std::string_view written, cvn::ZxmlField field) {
  return read == cvn::zxmlText(written, field);
}

bool sameAnnotations(const std::vector<cvn::QaxAnnotation>& read,
                     const cvn::TagList<cvn::Annotation>& written) {
  if (read.size() != written.size()) return false;
  for (size_t i = 0; i < read.size(); ++i)
    if (!same(read[i].key, written[i].key, cvn::ZxmlField::kName) ||
        !same(read[i].text, written[i].text, cvn::ZxmlField::kValue))
      return false;
  return true;
}

bool sameTag(const cvn::QaxNode& read, const cvn::Tag& written) {
  if (!same(read.name, written.name(), cvn::ZxmlField::kName) ||
      read.branch != (written.kind() == cvn::Tag::Kind::kBranch) ||
      !same(read.value, written.value() ? written.value()->textForm() : "",
            cvn::ZxmlField::kValue) ||
      !sameAnnotations(read.annotations, written.annotations()) ||
      read.properties.size() != written.properties().size() ||
      read.children.size() != written.children().size())
    return false;
  for (size_t i = 0; i < read.properties.size(); ++i) {
    const cvn::QaxProperty& p = read.properties[i];
    const cvn::TagProperty& w = *written.properties()[i];
    if (!same(p.name, w.name(), cvn::ZxmlField::kName) ||
        !same(p.value, w.value().textForm(), cvn::ZxmlField::kValue) ||
        !sameAnnotations(p.annotations, w.annotations()))
      return false;
  }
  for (size_t i = 0; i < read.children.size(); ++i)
    if (!sameTag(read.children[i], *written.children()[i])) return false;
  return true;
}

bool sameTree(const cvn::QaxBlock& block, const cvn::TagTree& tree) {
  return block.tree.nodes.size() == 1 && sameTag(block.tree.nodes[0], tree.top());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  std::string_view input(reinterpret_cast<const char*>(data), size);
  size_t nul = input.rfind('\0');
  std::string document(input.substr(0, nul));
  std::string tools = nul == std::string_view::npos ? "" : std::string(input.substr(nul + 1));

  cvn::FakeScanSources fakes;
  ToolsPrint runner(tools);
  fakes.processes.entries = {{1, 0, tools.substr(0, 16)}};
  cvn::ScanSources sources = fakes.sources();
  cvn::ScanSources with_tools{runner, sources.processes, sources.files, sources.clock,
                              sources.computer_name};
  cvn::ScanResult result =
      cvn::runScanPipeline(std::move(document), {}, cvn::ScanRequest(), with_tools);

  cvn::QaxFile file;
  std::string error;
  if (!cvn::parseQaxImage(result.image.data(), result.image.size(), &file, &error))
    __builtin_trap();
  if (!file.ambiguities.empty() || file.blocks.size() != 2) __builtin_trap();
  if (!sameTree(file.blocks[0], *result.snapshot) || !sameTree(file.blocks[1], *result.asset_info))
    __builtin_trap();
  return 0;
}
