#include <cstdint>
#include <cstdlib>

#include "MarletFoundation/Marlet/MarletResultInfoSnapshot.h"

using namespace MarletFoundation;

/// A timeline file: reading never fails, and what was read survives being written.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  using Format = MarletResultInfoSnapshot::Format;
  const Data input(std::vector<std::uint8_t>(bytes, bytes + size));
  const MarletResultInfoSnapshot read(input, Format::LegacyInlineResultsTimeline);
  const MarletResultInfoSnapshot again(read.data(Format::LegacyInlineResultsTimeline),
                                       Format::LegacyInlineResultsTimeline);
  if (again.inlineResults().size() != read.inlineResults().size()) std::abort();
  for (const auto& [line, result] : read.inlineResults()) {
    if (again.inlineResults().at(line).characterOffset != result.characterOffset) std::abort();
  }
  return 0;
}
