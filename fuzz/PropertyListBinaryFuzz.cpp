// Any bytes behind the binary form's mark: read or refused. What is read has a binary form that reads as the same
// value.
#include "PropertyListFuzz.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  const std::string_view body(reinterpret_cast<const char*>(bytes), size);
  MarletFoundation::checkReading("bplist00" + std::string(body),
                                 MarletFoundation::PropertyListFormat::binary);
  return 0;
}
