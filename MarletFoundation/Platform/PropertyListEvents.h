#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/Date.h"

namespace MarletFoundation {

/// Takes what a reader meets, in document order. A reader makes well-formed sequences only: one value, every
/// container closed, in a dictionary a key before each value. Texts are valid UTF-8 and hold during the call.
class PropertyListEvents {
 public:
  virtual void beginArray() = 0;
  virtual void beginDictionary() = 0;
  /// Ends the innermost open container.
  virtual void end() = 0;
  /// The key of the value that follows. A dictionary may repeat a key; the last value counts.
  virtual void key(std::string_view text) = 0;
  virtual void string(std::string_view text) = 0;
  virtual void data(Data bytes) = 0;
  virtual void date(Date date) = 0;
  virtual void integer(std::int64_t number) = 0;
  virtual void real(double number) = 0;
  virtual void boolean(bool flag) = 0;

 protected:
  ~PropertyListEvents() = default;
};

/// Reads a property list in either form, known by its first bytes. Throws an `ErrorObject` of
/// `PropertyListErrorDomain`; events may have been sent before.
void readPropertyList(const Data& data, PropertyListEvents& events);

void readXMLPropertyList(std::string_view bytes, PropertyListEvents& events);
void readBinaryPropertyList(std::string_view bytes, PropertyListEvents& events);

}  // namespace MarletFoundation
