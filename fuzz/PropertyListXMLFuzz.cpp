// Any text: read or refused. What is read has an XML form that reads as the same value.
#include "PropertyListFuzz.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  std::string text(reinterpret_cast<const char*>(bytes), size);
  // The binary form has a target of its own.
  if (text.starts_with("bplist")) text[0] = '<';
  MarletFoundation::checkReading(text, MarletFoundation::PropertyListFormat::xml);
  return 0;
}
