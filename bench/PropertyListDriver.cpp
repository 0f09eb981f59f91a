// The C++ side of scripts/compare-plistlib. Documents pass through standard input and output, each behind its
// length in four bytes.
//
//   generate SEED COUNT    random values: each in XML, then in binary form
//   verify SEED COUNT      reads what came of them, in the same order; prints how many differ
//   read                   answers each document with the value in binary form behind a "V", or with "E" and the
//                          error's code
#include <cstring>
#include <iostream>
#include <iterator>
#include <random>

#include "MarletFoundation/Data/PropertyListSerializable.h"

namespace {

using namespace MarletFoundation;
using PropertyListSerialization::read;
using PropertyListSerialization::write;

class RandomValues {
 public:
  explicit RandomValues(std::uint64_t seed) : random_(seed) {}

  PropertyListValue value(int depth = 0) {
    switch (below(depth < 4 ? 8 : 6)) {
      case 0:
        return text(true);
      case 1:
        return integer();
      case 2:
        return real();
      case 3:
        return below(2) == 0;
      case 4:
        // Whole seconds of the years 1 to 9999, which XML and the peer can carry.
        return Date{static_cast<double>(static_cast<std::int64_t>(random_() % 315537897600) - 63113904000)};
      case 5:
        return Data(bytes());
      case 6: {
        PropertyListValue::Array array;
        for (auto count = below(6); count > 0; --count) array.push_back(value(depth + 1));
        return array;
      }
      default: {
        PropertyListDictionary dictionary;
        for (auto count = below(6); count > 0; --count) dictionary[text(false)] = value(depth + 1);
        return dictionary;
      }
    }
  }

 private:
  std::uint64_t below(std::uint64_t limit) { return random_() % limit; }

  PropertyListValue integer() { return static_cast<std::int64_t>(random_()) >> below(64); }

  PropertyListValue real() {
    if (below(3) == 0) return static_cast<double>(below(1000)) / 8;
    while (true) {
      const auto bits = random_();
      double number;
      std::memcpy(&number, &bits, sizeof number);
      // The peer unifies 0 and -0, and not a number differs from itself.
      if (number == number && number != 0) return number;
    }
  }

  std::string bytes() {
    std::string data(below(40), '\0');
    for (char& byte : data) byte = static_cast<char>(random_());
    return data;
  }

  std::string text(bool withCarriageReturns) {
    constexpr const char* pieces[] = {"a",      "Key",    "<",      "&",          ">",  "\"",
                                      "\t",     "\n",     " ",      "]]>",        "0",  "é",
                                      "\u05D0", "\u2028", "\uFFFD", "\U0001F600", "\r", "\r\n"};
    std::string string;
    for (auto count = below(9); count > 0; --count)
      string += pieces[below(std::size(pieces) - (withCarriageReturns ? 0 : 2))];
    return string;
  }

  std::mt19937_64 random_;
};

// The peer writes each line's end into XML as a line feed.
PropertyListValue withLineFeeds(PropertyListValue value) {
  if (const auto* string = value.string()) {
    std::string text;
    for (std::size_t i = 0; i < string->size(); ++i) {
      if ((*string)[i] == '\r' && i + 1 < string->size() && (*string)[i + 1] == '\n') continue;
      text += (*string)[i] == '\r' ? '\n' : (*string)[i];
    }
    return text;
  }
  if (const auto* array = value.array()) {
    auto changed = *array;
    for (auto& child : changed) child = withLineFeeds(child);
    return changed;
  }
  if (const auto* dictionary = value.dictionary()) {
    PropertyListDictionary changed;
    for (const auto& [key, child] : *dictionary) changed[key] = withLineFeeds(child);
    return changed;
  }
  return value;
}

std::string standardInput() { return {std::istreambuf_iterator<char>(std::cin), {}}; }

void send(std::string_view document) {
  const auto size = static_cast<std::uint32_t>(document.size());
  const char length[] = {static_cast<char>(size), static_cast<char>(size >> 8), static_cast<char>(size >> 16),
                         static_cast<char>(size >> 24)};
  std::cout.write(length, 4) << document;
}

Data next(const std::string& input, std::size_t& place) {
  std::uint32_t size = 0;
  for (std::size_t i = 0; i < 4; ++i)
    size |= std::uint32_t{static_cast<std::uint8_t>(input[place + i])} << (8 * i);
  place += 4 + size;
  return Data(input.substr(place - size, size));
}

void generate(std::uint64_t seed, std::size_t count) {
  RandomValues values(seed);
  while (count-- > 0) {
    const auto value = values.value();
    send(write(value, PropertyListFormat::xml).view());
    send(write(value, PropertyListFormat::binary).view());
  }
}

void verify(std::uint64_t seed, std::size_t count) {
  const auto input = standardInput();
  RandomValues values(seed);
  std::size_t place = 0;
  std::size_t different = 0;
  while (count-- > 0) {
    const auto value = values.value();
    if (!(read(next(input, place)) == withLineFeeds(value))) ++different;
    if (!(read(next(input, place)) == value)) ++different;
  }
  std::cout << different;
}

void readAll() {
  const auto input = standardInput();
  for (std::size_t place = 0; place < input.size();) {
    try {
      const auto value = read(next(input, place));
      send(std::string("V").append(write(value, PropertyListFormat::binary).view()));
    } catch (const ErrorObject& error) {
      send(std::string("E").append(std::to_string(error.code())));
    }
  }
}

}  // namespace

int main(int argc, char** argv) {
  std::ios::sync_with_stdio(false);
  const std::string_view mode = argc > 1 ? argv[1] : "";
  if (mode == "generate" && argc == 4) {
    generate(std::stoull(argv[2]), std::stoull(argv[3]));
  } else if (mode == "verify" && argc == 4) {
    verify(std::stoull(argv[2]), std::stoull(argv[3]));
  } else if (mode == "read") {
    readAll();
  } else {
    return 2;
  }
}
