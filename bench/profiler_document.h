// A generated profiler document for the scan benchmarks: one applications
// data type with the given number of items and one disk with a tenth as
// many volumes, shaped as the profiler prints them.
#ifndef CVN_BENCH_PROFILER_DOCUMENT_H_
#define CVN_BENCH_PROFILER_DOCUMENT_H_

#include <string>

namespace cvn {

inline void appendKey(std::string& doc, const char* key, const std::string& value) {
  doc += "\t\t\t\t<key>";
  doc += key;
  doc += "</key>\n\t\t\t\t<string>";
  doc += value;
  doc += "</string>\n";
}

inline std::string makeDocument(int applications) {
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

}  // namespace cvn

#endif  // CVN_BENCH_PROFILER_DOCUMENT_H_
