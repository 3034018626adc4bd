// What every section builder shares: finding a data type's items in the raw
// tree, reading raw keys as text, and the common field conversions.
#ifndef CVN_SECTIONS_BUILDER_UTIL_H_
#define CVN_SECTIONS_BUILDER_UTIL_H_

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "zxml/format_text.h"
#include "zxml/tag.h"

namespace cvn {

/// The "_items" tag under the raw top tag's child `data_type`, or null.
const Tag* findItems(const TagTree& raw, std::string_view data_type);
/// The first child of "_items" of `data_type`, or null.
const Tag* findFirstItem(const TagTree& raw, std::string_view data_type);
/// The raw position of an entry of a converted array: N for a tag named
/// "itemN", else `index` (its place among its siblings). Array elements that
/// the converter stores nothing for leave no tag, so names can have gaps.
size_t itemPosition(const Tag& item, size_t index);

/// Apple Silicon's memory item: soldered memory beside the chip, its size
/// under the data type's own name ("SPMemoryDataType" "16 GB"), no slots.
bool isUnifiedMemory(const Tag& item);

/// The raw key's value, or null when the key is missing.
const TagValue* rawValue(const Tag& item, std::string_view key);
/// The raw key's text: its value when that is text, else empty. A view
/// into the raw tree.
std::string_view rawText(const Tag& item, std::string_view key);
bool hasKey(const Tag& item, std::string_view key);

/// Copy: sets `field` to the raw value whatever its kind; a missing key gives
/// an empty value (the property is still created).
void copyField(Tag& record, std::string_view field, const Tag& item, std::string_view key);
/// Copy, but only when the key is present.
void copyFieldIfPresent(Tag& record, std::string_view field, const Tag& item, std::string_view key);

/// "1" when `text` equals `yes` exactly, else "0".
std::string flagText(std::string_view text, std::string_view yes);

/// SizeText::toGigabytes x 1024, narrowed to float, truncated to an integer.
/// Sizes beyond the integer range (and texts such as "nan GB") give 0.
int64_t sizeInMegabytes(std::string_view size_text);
/// `value` truncated toward zero, or 0 when it does not fit an int64_t, so
/// that no out-of-range conversion can happen.
int64_t truncateToInt64(double value);

/// A complex record: the parent gets an empty-text property named `name`
/// annotated "complex", then the child tag of that name is added.
Tag& addComplexRecord(Tag& parent, std::string_view name);

}  // namespace cvn

#endif  // CVN_SECTIONS_BUILDER_UTIL_H_
