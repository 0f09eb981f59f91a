#include "MarletFoundation/Version/MarletFoundationVersion.h"

namespace MarletFoundation {
namespace {

/// Made by the compiler, so that it can be read at any time, by other constants too.
constexpr double majorAndMinor(std::string_view version) {
  double digits = 0;
  double scale = 1;
  bool inMinor = false;
  for (const char c : version) {
    if (c == '.') {
      if (inMinor) break;
      inMinor = true;
      continue;
    }
    digits = digits * 10 + (c - '0');
    if (inMinor) scale *= 10;
  }
  return digits / scale;
}

static_assert(majorAndMinor("12.34.5") == 12.34);

}  // namespace

constinit const double MarletFoundationVersionNumber = majorAndMinor(MARLET_VERSION_STRING);
constinit const std::string_view MarletFoundationVersionString = MARLET_VERSION_STRING;

}  // namespace MarletFoundation
