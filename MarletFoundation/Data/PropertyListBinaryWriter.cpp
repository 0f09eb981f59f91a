#include <bit>
#include <cmath>
#include <cstring>

#include "MarletFoundation/Data/PropertyListChildren.h"
#include "MarletFoundation/Data/PropertyListWriters.h"
#include "MarletFoundation/Platform/PropertyListError.h"
#include "MarletFoundation/Platform/PropertyListText.h"
#include "MarletFoundation/Platform/PropertyListWork.h"

namespace MarletFoundation {
namespace {

using enum PropertyListErrorCode;

enum class Kind : std::uint8_t { boolean, integer, real, date, string, data, array, dictionary };

// An object of the file: the bits of a number, the bytes of a text, or the place of a container's references.
struct Object {
  Kind kind;
  std::uint64_t bits;
  const char* bytes = nullptr;

  bool isText() const { return kind == Kind::string || kind == Kind::data; }
  std::string_view text() const { return {bytes, bits}; }
  bool operator==(const Object& other) const {
    return kind == other.kind && bits == other.bits &&
           (!isText() || bits == 0 || std::memcmp(bytes, other.bytes, bits) == 0);
  }
};

std::uint32_t hash(const Object& object) {
  constexpr std::uint64_t multiplier = 0x9E3779B97F4A7C15;
  auto state = (object.bits + static_cast<std::uint64_t>(object.kind)) * multiplier;
  if (object.isText()) {
    const auto mix = [&state](std::uint64_t word) { state = (std::rotl(state, 29) ^ word) * multiplier; };
    std::size_t place = 0;
    std::uint64_t word = 0;
    for (; place + 8 <= object.bits; place += 8) {
      std::memcpy(&word, object.bytes + place, 8);
      mix(word);
    }
    word = 0;
    if (place < object.bits) std::memcpy(&word, object.bytes + place, object.bits - place);
    mix(word);
  }
  // A product's low bits know nothing of its factors' high ones, which for some numbers are all.
  state = (state ^ state >> 32) * multiplier;
  return static_cast<std::uint32_t>(state >> 32);
}

// The bytes that an unsigned number needs: 1, 2, 4 or 8.
unsigned widthOf(std::uint64_t number) {
  if (number <= 0xFF) return 1;
  if (number <= 0xFFFF) return 2;
  return number <= 0xFFFFFFFF ? 4 : 8;
}

// A place of the hash table: an object and its hash, or an object's number 0 for an empty place. Object 0 is the
// root, which nothing repeats.
struct Slot {
  std::uint32_t hash = 0;
  std::uint32_t object = 0;
};

// A container whose next child's object is to be referred to at a place.
struct OpenContainer {
  PropertyListChildren children;
  std::size_t reference;
};

// How many places of the table are looked at for an equal scalar. Good hashes never need as many; where somebody
// made numbers that share theirs, some are written again. At a place with the same hash a text may be compared, which
// counts for more.
constexpr int mostProbes = 512;
constexpr int probesOfComparison = 64;

class BinaryWriter {
 public:
  std::string write(const PropertyListValue& value);

 private:
  std::uint32_t add(const PropertyListValue& value);
  std::uint32_t addContainer(const PropertyListValue& value);
  void addNextChild();
  std::uint32_t addScalar(const Object& scalar);
  std::uint32_t addText(Kind kind, std::string_view text);
  std::uint32_t append(const Object& object);
  void growTable();

  void writeObject(const Object& object);
  void writeString(std::string_view text);
  void writeInteger(std::uint64_t bits);
  void writeMarker(unsigned kind, std::uint64_t count);
  void writeUnsigned(std::uint64_t number, unsigned width);

  std::vector<Object> objects_;
  // Of each container the number of its children, then their objects; of a dictionary all keys, then all
  // values.
  std::vector<std::uint32_t> references_;
  // Scalars by hash. Its size is a power of two.
  std::vector<Slot> table_ = std::vector<Slot>(64);
  std::size_t scalarCount_ = 0;
  std::vector<OpenContainer> open_;
  std::size_t probes_ = 0;
  std::size_t textWritten_ = 0;
  std::size_t textShared_ = 0;
  unsigned referenceWidth_ = 1;
  std::string bytes_;
};

std::string BinaryWriter::write(const PropertyListValue& value) {
  add(value);
  while (!open_.empty()) addNextChild();
  countPropertyListWork(probes_);
  referenceWidth_ = widthOf(objects_.size() - 1);
  bytes_ = "bplist00";
  std::vector<std::uint64_t> offsets;
  offsets.reserve(objects_.size());
  for (const auto& object : objects_) {
    offsets.push_back(bytes_.size());
    writeObject(object);
  }
  const auto table = bytes_.size();
  const auto offsetWidth = widthOf(table);
  for (const auto offset : offsets) writeUnsigned(offset, offsetWidth);
  writeUnsigned(0, 6);
  writeUnsigned(offsetWidth, 1);
  writeUnsigned(referenceWidth_, 1);
  writeUnsigned(objects_.size(), 8);
  writeUnsigned(0, 8);
  writeUnsigned(table, 8);
  return std::move(bytes_);
}

std::uint32_t BinaryWriter::add(const PropertyListValue& value) {
  if (const auto* string = value.string()) return addText(Kind::string, *string);
  if (const auto* integer = value.integer())
    return addScalar({Kind::integer, static_cast<std::uint64_t>(*integer)});
  if (const auto* real = value.floatingPoint())
    return addScalar({Kind::real, std::bit_cast<std::uint64_t>(*real)});
  if (const auto* boolean = value.boolean()) return addScalar({Kind::boolean, *boolean ? 1U : 0U});
  if (const auto* data = value.data()) return addText(Kind::data, data->view());
  if (const auto* date = value.date()) {
    if (!std::isfinite(date->secondsSinceReferenceDate))
      throw propertyListError(unwritableDate, "it is not finite");
    return addScalar({Kind::date, std::bit_cast<std::uint64_t>(date->secondsSinceReferenceDate)});
  }
  return addContainer(value);
}

// Of a dictionary, the keys come before all values.
std::uint32_t BinaryWriter::addContainer(const PropertyListValue& value) {
  const auto* dictionary = value.dictionary();
  const auto count = dictionary ? dictionary->size() : value.array()->size();
  auto place = references_.size();
  const auto object = append({dictionary ? Kind::dictionary : Kind::array, place});
  references_.resize(place + 1 + (dictionary ? 2 * count : count));
  references_[place++] = static_cast<std::uint32_t>(count);
  if (dictionary) {
    for (const auto& entry : *dictionary) references_[place++] = addText(Kind::string, entry.key);
  }
  open_.push_back({PropertyListChildren(value), place});
  return object;
}

void BinaryWriter::addNextChild() {
  auto& container = open_.back();
  if (container.children.atEnd()) return open_.pop_back();
  const auto place = container.reference++;
  const auto object = add(container.children.next());
  references_[place] = object;
}

std::uint32_t BinaryWriter::append(const Object& object) {
  if (objects_.size() == 0xFFFFFFFE) throw propertyListError(lengthOutOfRange, "too many objects to write");
  objects_.push_back(object);
  return static_cast<std::uint32_t>(objects_.size() - 1);
}

// A scalar that equals one before is that one.
std::uint32_t BinaryWriter::addScalar(const Object& scalar) {
  const auto mask = table_.size() - 1;
  const auto key = hash(scalar);
  auto slot = key & mask;
  for (auto left = mostProbes; table_[slot].object != 0; slot = (slot + 1) & mask) {
    const auto object = table_[slot].object;
    ++probes_;
    left -= table_[slot].hash == key ? probesOfComparison : 1;
    if (left <= 0) return append(scalar);
    if (table_[slot].hash != key || !(objects_[object] == scalar)) continue;
    if (!scalar.isText()) return object;
    // A reader may only expand a file in proportion to its size. A long text that is repeated beyond that is
    // written again, so that whatever is written can be read.
    if (textShared_ + scalar.bits > 8 * textWritten_ + 32768) break;
    textShared_ += scalar.bits;
    return object;
  }
  const auto object = append(scalar);
  if (scalar.isText()) textWritten_ += scalar.bits;
  if (std::exchange(table_[slot], {key, object}).object == 0 && 2 * ++scalarCount_ > table_.size())
    growTable();
  return object;
}

std::uint32_t BinaryWriter::addText(Kind kind, std::string_view text) {
  return addScalar({kind, text.size(), text.data()});
}

void BinaryWriter::growTable() {
  const auto old = std::exchange(table_, std::vector<Slot>(4 * table_.size()));
  const auto mask = table_.size() - 1;
  for (const auto& entry : old) {
    if (entry.object == 0) continue;
    auto slot = entry.hash & mask;
    while (table_[slot].object != 0) slot = (slot + 1) & mask;
    table_[slot] = entry;
  }
}

void BinaryWriter::writeObject(const Object& object) {
  switch (object.kind) {
    case Kind::boolean:
      return writeUnsigned(object.bits == 1 ? 0x09 : 0x08, 1);
    case Kind::integer:
      return writeInteger(object.bits);
    case Kind::real:
    case Kind::date:
      writeUnsigned(object.kind == Kind::real ? 0x23 : 0x33, 1);
      return writeUnsigned(object.bits, 8);
    case Kind::string:
      return writeString(object.text());
    case Kind::data:
      writeMarker(0x4, object.bits);
      bytes_ += object.text();
      return;
    case Kind::array:
    case Kind::dictionary: {
      const bool isArray = object.kind == Kind::array;
      const std::size_t count = references_[object.bits];
      writeMarker(isArray ? 0xA : 0xD, count);
      const auto* const first = references_.data() + object.bits + 1;
      for (std::size_t i = 0; i < (isArray ? count : 2 * count); ++i)
        writeUnsigned(first[i], referenceWidth_);
    }
  }
}

void BinaryWriter::writeString(std::string_view text) {
  if (PropertyListText::isASCII(text)) {
    writeMarker(0x5, text.size());
    bytes_ += text;
    return;
  }
  if (PropertyListText::findInvalidUTF8(text) != PropertyListText::npos)
    throw propertyListError(unwritableText, "it is not valid UTF-8");
  std::u16string units;
  units.reserve(text.size());
  for (std::size_t place = 0; place < text.size();) {
    const auto character = PropertyListText::nextCharacter(text, place);
    if (character < 0x10000) {
      units.push_back(static_cast<char16_t>(character));
    } else {
      units.push_back(static_cast<char16_t>(0xD7C0 + (character >> 10)));
      units.push_back(static_cast<char16_t>(0xDC00 + (character & 0x3FF)));
    }
  }
  writeMarker(0x6, units.size());
  for (const auto unit : units) writeUnsigned(unit, 2);
}

// One, two and four bytes stand for unsigned numbers, eight for a signed one.
void BinaryWriter::writeInteger(std::uint64_t bits) {
  const auto width = widthOf(bits);
  writeUnsigned(0x10U + static_cast<unsigned>(std::countr_zero(width)), 1);
  writeUnsigned(bits, width);
}

void BinaryWriter::writeMarker(unsigned kind, std::uint64_t count) {
  if (count < 0xF) return writeUnsigned(kind << 4 | count, 1);
  writeUnsigned(kind << 4 | 0xF, 1);
  writeInteger(count);
}

void BinaryWriter::writeUnsigned(std::uint64_t number, unsigned width) {
  char buffer[8];
  for (unsigned i = width; i-- > 0; number >>= 8) buffer[i] = static_cast<char>(number & 0xFF);
  bytes_.append(buffer, width);
}

}  // namespace

std::string binaryPropertyList(const PropertyListValue& value) { return BinaryWriter().write(value); }

}  // namespace MarletFoundation
