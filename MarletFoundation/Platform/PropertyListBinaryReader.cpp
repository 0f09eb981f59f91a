#include <algorithm>
#include <bit>
#include <cmath>
#include <cstring>
#include <limits>
#include <unordered_set>
#include <vector>

#include "MarletFoundation/Platform/PropertyListError.h"
#include "MarletFoundation/Platform/PropertyListEvents.h"
#include "MarletFoundation/Platform/PropertyListText.h"

namespace MarletFoundation {
namespace {

using enum PropertyListErrorCode;

constexpr std::size_t headerSize = 8;
constexpr std::size_t trailerSize = 32;

// A container of which some children were sent already.
struct OpenContainer {
  std::uint64_t object;
  // Where its references to values begin; those to a dictionary's keys lie before them.
  std::size_t values;
  std::size_t keys;
  std::uint64_t count;
  std::uint64_t next;
  bool isDictionary;
};

class BinaryReader {
 public:
  BinaryReader(std::string_view bytes, PropertyListEvents& events) : bytes_(bytes), events_(events) {}

  void read();

 private:
  void readTrailer();
  std::uint64_t unsignedAt(std::size_t place, std::size_t width) const;
  std::uint64_t referenceAt(std::size_t place) const;
  std::size_t offsetOf(std::uint64_t object) const;

  void readValue(std::uint64_t object, std::size_t referencedAt);
  void readNumber(std::size_t place, unsigned kind, unsigned size);
  void readKey(std::uint64_t object, std::size_t referencedAt);
  std::string_view text(std::size_t place);
  void open(std::uint64_t object, std::size_t place, bool isDictionary);
  void readNextChild();

  std::uint64_t count(std::size_t& place) const;
  /// The bytes of `count` units behind `place`, checked against the object area's end.
  std::string_view body(std::size_t object, std::size_t place, std::uint64_t count,
                        std::size_t unitSize) const;
  void spend(std::size_t nodes, std::size_t textBytes, std::size_t place);
  /// Whether an open container lies within itself. A cycle is looked for only where it ends: at a limit.
  bool isCyclic() const;

  [[noreturn]] void fail(PropertyListErrorCode code, std::size_t place, std::string_view detail = {}) const {
    throw propertyListError(code, detail, place);
  }

  const std::string_view bytes_;
  PropertyListEvents& events_;
  std::size_t offsetWidth_ = 0;
  std::size_t referenceWidth_ = 0;
  std::uint64_t objectCount_ = 0;
  std::uint64_t rootObject_ = 0;
  std::size_t tableOffset_ = 0;
  std::vector<OpenContainer> open_;
  std::string scratch_;
  // What sharing may still expand to.
  std::size_t nodesLeft_ = 0;
  std::size_t textLeft_ = 0;
};

void BinaryReader::read() {
  readTrailer();
  nodesLeft_ = 4 * bytes_.size() + 1024;
  textLeft_ = 16 * bytes_.size() + 65536;
  readValue(rootObject_, bytes_.size() - 16);
  while (!open_.empty()) readNextChild();
}

void BinaryReader::readTrailer() {
  if (bytes_.size() < headerSize + 1 + 1 + trailerSize) fail(truncated, bytes_.size());
  const auto trailer = bytes_.size() - trailerSize;
  offsetWidth_ = unsignedAt(trailer + 6, 1);
  referenceWidth_ = unsignedAt(trailer + 7, 1);
  objectCount_ = unsignedAt(trailer + 8, 8);
  rootObject_ = unsignedAt(trailer + 16, 8);
  const auto table = unsignedAt(trailer + 24, 8);
  if (offsetWidth_ < 1 || offsetWidth_ > 8) fail(invalidTrailer, trailer + 6, "width of offsets");
  if (referenceWidth_ < 1 || referenceWidth_ > 8) fail(invalidTrailer, trailer + 7, "width of references");
  if (table <= headerSize || table >= trailer)
    fail(invalidTrailer, trailer + 24, "place of the offset table");
  tableOffset_ = static_cast<std::size_t>(table);
  if (objectCount_ < 1 || objectCount_ > (trailer - tableOffset_) / offsetWidth_)
    fail(invalidTrailer, trailer + 8, "number of objects");
  if (rootObject_ >= objectCount_) fail(invalidTrailer, trailer + 16, "root object");
}

inline std::uint64_t BinaryReader::unsignedAt(std::size_t place, std::size_t width) const {
  const auto byteAt = [this](std::size_t at) { return std::uint64_t{static_cast<std::uint8_t>(bytes_[at])}; };
  if (width == 1) return byteAt(place);
  if (width == 2) return byteAt(place) << 8 | byteAt(place + 1);
  std::uint64_t number = 0;
  for (std::size_t i = 0; i < width; ++i) number = number << 8 | byteAt(place + i);
  return number;
}

inline std::uint64_t BinaryReader::referenceAt(std::size_t place) const {
  const auto object = unsignedAt(place, referenceWidth_);
  if (object >= objectCount_) fail(invalidReference, place);
  return object;
}

inline std::size_t BinaryReader::offsetOf(std::uint64_t object) const {
  const auto place = tableOffset_ + static_cast<std::size_t>(object) * offsetWidth_;
  const auto offset = unsignedAt(place, offsetWidth_);
  if (offset < headerSize || offset >= tableOffset_) fail(invalidOffset, place);
  return static_cast<std::size_t>(offset);
}

void BinaryReader::readValue(std::uint64_t object, std::size_t referencedAt) {
  const auto place = offsetOf(object);
  spend(1, 0, referencedAt);
  const auto marker = static_cast<std::uint8_t>(bytes_[place]);
  const unsigned size = marker & 0xF;
  switch (marker >> 4) {
    case 0x0:
      if (marker == 0x08 || marker == 0x09) return events_.boolean(marker == 0x09);
      if (marker == 0x00) fail(unsupportedObject, place, "null");
      if (marker == 0x0F) fail(unsupportedObject, place, "fill");
      break;
    case 0x1:
    case 0x2:
    case 0x3:
      return readNumber(place, marker >> 4, size);
    case 0x4: {
      auto start = place;
      const auto length = count(start);
      const auto data = body(place, start, length, 1);
      spend(0, data.size(), referencedAt);
      return events_.data(PropertyListText::copiedData(data));
    }
    case 0x5:
    case 0x6: {
      const auto string = text(place);
      spend(0, string.size(), referencedAt);
      return events_.string(string);
    }
    case 0x8:
      fail(unsupportedObject, place, "uid");
    case 0xA:
      return open(object, place, false);
    case 0xB:
    case 0xC:
      fail(unsupportedObject, place, "set");
    case 0xD:
      return open(object, place, true);
    default:
      break;
  }
  fail(invalidObject, place);
}

void BinaryReader::readNumber(std::size_t place, unsigned kind, unsigned size) {
  const bool knownSize = kind == 0x1 ? size <= 4 : kind == 0x2 ? size == 2 || size == 3 : size == 3;
  if (!knownSize) fail(invalidObject, place);
  const std::size_t width = std::size_t{1} << size;
  body(place, place + 1, width, 1);
  if (kind == 0x1) {
    auto number = unsignedAt(place + 1, width < 8 ? width : 8);
    if (width == 16) {
      const auto high = number;
      number = unsignedAt(place + 9, 8);
      if (high != (number >> 63 ? ~std::uint64_t{0} : 0)) fail(integerOutOfRange, place);
    }
    return events_.integer(static_cast<std::int64_t>(number));
  }
  const auto bits = unsignedAt(place + 1, width);
  const double number =
      width == 4 ? std::bit_cast<float>(static_cast<std::uint32_t>(bits)) : std::bit_cast<double>(bits);
  if (kind == 0x2) return events_.real(number);
  if (!std::isfinite(number)) fail(invalidDate, place, "not finite");
  events_.date({number});
}

void BinaryReader::readKey(std::uint64_t object, std::size_t referencedAt) {
  const auto place = offsetOf(object);
  const auto kind = static_cast<std::uint8_t>(bytes_[place]) >> 4;
  if (kind != 0x5 && kind != 0x6) fail(keyNotString, place);
  const auto key = text(place);
  spend(1, key.size(), referencedAt);
  events_.key(key);
}

std::string_view BinaryReader::text(std::size_t place) {
  const bool isASCII = static_cast<std::uint8_t>(bytes_[place]) >> 4 == 0x5;
  auto start = place;
  const auto length = count(start);
  const auto units = body(place, start, length, isASCII ? 1 : 2);
  if (isASCII) {
    if (PropertyListText::isASCII(units)) return units;
    fail(invalidString, start + PropertyListText::findNonASCII(units), "ASCII");
  }
  scratch_.clear();
  const auto read = PropertyListText::appendUTF8FromUTF16(scratch_, units, true);
  if (read != units.size()) fail(invalidString, start + read, "an unpaired surrogate");
  return scratch_;
}

void BinaryReader::open(std::uint64_t object, std::size_t place, bool isDictionary) {
  auto start = place;
  const auto length = count(start);
  body(place, start, length, isDictionary ? 2 * referenceWidth_ : referenceWidth_);
  const auto values = isDictionary ? start + static_cast<std::size_t>(length) * referenceWidth_ : start;
  open_.push_back({object, values, start, length, 0, isDictionary});
  if (isDictionary) {
    events_.beginDictionary();
  } else {
    events_.beginArray();
  }
}

void BinaryReader::readNextChild() {
  auto& container = open_.back();
  if (container.next == container.count) {
    open_.pop_back();
    return events_.end();
  }
  const auto distance = static_cast<std::size_t>(container.next++) * referenceWidth_;
  const auto value = container.values + distance;
  if (container.isDictionary) readKey(referenceAt(container.keys + distance), container.keys + distance);
  readValue(referenceAt(value), value);
}

// An object's count: in its marker, or, where that is full, in the integer that follows. Moves `place` from
// the marker to the object's body.
std::uint64_t BinaryReader::count(std::size_t& place) const {
  const auto object = place;
  const auto inMarker = static_cast<std::uint8_t>(bytes_[place++]) & 0xF;
  if (inMarker < 0xF) return static_cast<std::uint64_t>(inMarker);
  body(object, place, 1, 1);
  const auto marker = static_cast<std::uint8_t>(bytes_[place++]);
  if (marker >> 4 != 0x1 || (marker & 0xF) > 3) fail(invalidObject, object, "its length is no integer");
  const std::size_t width = std::size_t{1} << (marker & 0xF);
  body(object, place, width, 1);
  place += width;
  return unsignedAt(place - width, width);
}

std::string_view BinaryReader::body(std::size_t object, std::size_t place, std::uint64_t count,
                                    std::size_t unitSize) const {
  const auto left = tableOffset_ - place;
  if (count > (unitSize == 1 ? left : left / unitSize)) fail(lengthOutOfRange, object);
  return bytes_.substr(place, static_cast<std::size_t>(count) * unitSize);
}

inline void BinaryReader::spend(std::size_t nodes, std::size_t textBytes, std::size_t place) {
  if (nodes > nodesLeft_ || textBytes > textLeft_) fail(isCyclic() ? cycle : tooMuchSharing, place);
  nodesLeft_ -= nodes;
  textLeft_ -= textBytes;
}

bool BinaryReader::isCyclic() const {
  std::unordered_set<std::uint64_t> met;
  const auto isRepeated = [&met](const OpenContainer& container) {
    return !met.insert(container.object).second;
  };
  return std::any_of(open_.begin(), open_.end(), isRepeated);
}

}  // namespace

void readBinaryPropertyList(std::string_view bytes, PropertyListEvents& events) {
  BinaryReader(bytes, events).read();
}

void readPropertyList(const Data& data, PropertyListEvents& events) {
  const auto bytes = data.view();
  // The binary reader hops from the end to the table to the objects, and most lists are small: all of one comes
  // into the cache at once, not line after line as it is asked for.
  for (std::size_t i = 0; i < std::min<std::size_t>(bytes.size(), 2048); i += 64) {
    __builtin_prefetch(bytes.data() + i);
  }
  if (bytes.starts_with("bplist00")) return readBinaryPropertyList(bytes, events);
  if (bytes.starts_with("bplist")) throw propertyListError(unknownFormat, "a later binary version", 0);
  readXMLPropertyList(bytes, events);
}

}  // namespace MarletFoundation
