#include "PropertyListCommand.h"

#include <cerrno>
#include <cstdio>
#include <iostream>
#include <iterator>
#include <optional>

#include "Ending.h"
#include "Guarded.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "SafeOutput.h"

using namespace MarletFoundation;

namespace {

Data readInput(const std::string& input) {
  if (input != "-") return FileManager::readFile(URL::file(input));
  std::string text(std::istreambuf_iterator<char>(std::cin), {});
  if (std::ferror(stdin)) throw ErrorObject::posix(errno, input);
  return Data(std::move(text));
}

Data inForm(const PropertyListValue& value, PropertyListOutput form) {
  switch (form) {
    case PropertyListOutput::xml:
      return PropertyListSerialization::write(value, PropertyListFormat::xml);
    case PropertyListOutput::binary:
      return PropertyListSerialization::write(value, PropertyListFormat::binary);
    case PropertyListOutput::json:
      break;
  }
  return Data(jsonText(value) + "\n");
}

}  // namespace

ExitStatus convertPropertyList(const std::string& input, PropertyListOutput form, const std::string& output,
                               const Terminal& terminal) {
  return guarded(input, terminal, [&] {
    const auto source = orFailWith(ExitStatus::unreadablePath, input, [&] { return readInput(input); });
    const auto result = inForm(PropertyListSerialization::read(source), form);
    if (output == "-") {
      printText(result.view());
    } else {
      commit(output, [&] { FileManager::writeFileAtomically(URL::file(output), result); });
    }
    return ExitStatus::good;
  });
}
