#include <cstdint>
#include <cstdlib>

#include "MarletFoundation/Marlet/MarletResultInfo.h"
#include "MarletFoundation/Platform/HostEnvironment.h"

using namespace MarletFoundation;

namespace {

using Format = MarletResultInfoSnapshot::Format;

void require(bool condition) {
  if (!condition) std::abort();
}

bool silenced() {
  auto environment = HostEnvironment::defaults();
  environment.diagnostics = [](std::string_view) {};
  environment.systemLog = [](std::string_view) {};
  HostEnvironment::setCurrent(environment);
  return true;
}

}  // namespace

/// A result file: what is read must survive being written. Sizes that are no number never compare equal, so
/// the second written form is compared with the first.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  [[maybe_unused]] static const bool quiet = silenced();
  const Data input(std::vector<std::uint8_t>(bytes, bytes + size));
  try {
    const MarletResultInfoSnapshot read(input, Format::ResultInfo);
    const auto written = read.data(Format::ResultInfo);
    const MarletResultInfoSnapshot again(written, Format::ResultInfo);
    require(again.assessmentInformation() == read.assessmentInformation());
    require(again.inlineResults().size() == read.inlineResults().size());
    require(again.data(Format::ResultInfo) == written);

    const MarletResultInfoSnapshot timeline(read.data(Format::LegacyInlineResultsTimeline),
                                            Format::LegacyInlineResultsTimeline);
    for (const auto& [line, result] : read.inlineResults())
      require(line < 0 || timeline.inlineResults().count(line) == 1);
  } catch (const Error&) {
  }
  return 0;
}
