// Processor texts of the hardware overview that the Processors section and
// the asset summary must read alike.
#ifndef CVN_COLLECT_PROCESSOR_TEXT_H_
#define CVN_COLLECT_PROCESSOR_TEXT_H_

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace cvn {

/// Apple Silicon's "number_processors" text, "proc T:P:E" (M5 Max prints a
/// fourth field): the total core count T. Nothing for any other text.
std::optional<int64_t> coreCountOfProcText(std::string_view text);

/// A clock speed of the hardware overview in whole MHz, rounded to the
/// nearest: "2.66 GHz", with a decimal comma in some locales ("2,01 GHz"),
/// or "867 MHz" from very old profilers. The first word is the number; 0
/// when it is none, or negative.
int64_t megahertzOfSpeedText(std::string_view text);

/// The maker of a processor by its name: "GenuineIntel" for an Intel name,
/// "Apple Inc." for a chip whose name begins with "Apple", else empty.
std::string processorMakerOf(std::string_view model);

}  // namespace cvn

#endif  // CVN_COLLECT_PROCESSOR_TEXT_H_
