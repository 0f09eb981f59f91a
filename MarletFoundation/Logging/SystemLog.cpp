#include "MarletFoundation/Logging/SystemLog.h"

#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

constexpr std::int64_t maxSystemLogLineLength = 200;

}  // namespace

void log(std::string_view message) {
  const auto& systemLog = HostEnvironment::current().systemLog;
  if (!systemLog) return;
  for (const auto& entry : ___breakLogStringUpForTruncationWorkaround(message, maxSystemLogLineLength))
    systemLog(entry);
}

void SystemLog(const char*, ...) { fatalError("do not call this function"); }

std::vector<std::string> ___breakLogStringUpForTruncationWorkaround(std::string_view text,
                                                                    std::int64_t maxLineLength) {
  if (maxLineLength < 1) fatalError("the length of a log line must be positive");
  std::vector<std::string> entries;
  for (std::size_t start = 0; start < text.size();) {
    const auto end = graphemeRunEnd(text, start, maxLineLength);
    entries.emplace_back(start == 0 ? "" : "TRUNCATED: ").append(text.substr(start, end - start));
    start = end;
  }
  return entries;
}

}  // namespace MarletFoundation
