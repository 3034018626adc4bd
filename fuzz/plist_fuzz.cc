// Property lists come straight from a tool's output: parse anything, convert
// it into a raw tree, read the network identity, and check that the cursor
// walk of the converter leaves the same tree as plain path storing.
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "../tests/tree_text.h"
#include "collect/network_identity.h"
#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "plist_path_reference.h"
#include "zxml/tag.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  std::string_view input(reinterpret_cast<const char*>(data), size);
  cvn::Plist root;
  std::string warning;
  if (!cvn::parsePlist(input, &root, &warning)) return 0;

  cvn::TagTree by_cursor(true, "Macintosh");
  cvn::PlistConverter converter(by_cursor);
  converter.convertPlist(root);
  cvn::TagTree by_path(true, "Macintosh");
  cvn::reference::convertPlist(by_path, root);
  if (cvn::treeText(&by_cursor.document()) != cvn::treeText(&by_path.document())) __builtin_trap();

  // A lone dictionary or array goes through the walkers directly.
  cvn::TagTree walked(true, "Macintosh");
  cvn::PlistConverter walker(walked);
  walker.convertDictionary(root, "/SPX/_items/item0");
  walker.convertArray(root, "/SPX/_items");
  walker.convertNamedList(root, "/SPX/list");

  std::string ip;
  cvn::NetworkIdentity identity;
  cvn::readNetworkIdentity(root, ip, &identity);
  std::string given = "192.168.1.5";
  cvn::readNetworkIdentity(root, given, &identity);
  return 0;
}
