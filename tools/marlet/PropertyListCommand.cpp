#include "PropertyListCommand.h"

#include <iostream>
#include <iterator>
#include <optional>

#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

Data readInput(const std::string& input) {
  if (input != "-") return FileManager::readFile(URL::file(input));
  return Data(std::string(std::istreambuf_iterator<char>(std::cin), {}));
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
  return Data(dumped(json(value)) + "\n");
}

}  // namespace

ExitStatus convertPropertyList(const std::string& input, PropertyListOutput form, const std::string& output,
                               const Terminal& terminal) {
  const auto complain = [&](const std::string& path, const std::string& reason) {
    terminal.complain(printable(path + ": " + reason));
  };
  Data source;
  try {
    source = readInput(input);
  } catch (const Error& error) {
    complain(input, ErrorObject(error).localizedDescription());
    return ExitStatus::unreadablePath;
  }
  Data result;
  try {
    result = inForm(PropertyListSerialization::read(source), form);
  } catch (const Error& error) {
    complain(input, ErrorObject(error).localizedDescription());
    return ExitStatus::negative;
  } catch (const NotRepresentable& reason) {
    complain(input, reason.what());
    return ExitStatus::negative;
  }
  if (output == "-") {
    std::cout << result.view();
    return ExitStatus::good;
  }
  try {
    FileManager::writeFileAtomically(URL::file(output), result);
  } catch (const Error& error) {
    complain(output, ErrorObject(error).localizedDescription());
    return ExitStatus::failedWrite;
  }
  return ExitStatus::good;
}
