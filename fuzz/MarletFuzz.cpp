#include <cstdlib>
#include <stdexcept>

#include "MarletFoundation/Marlet/Marlet.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/HostEnvironment.h"

using namespace MarletFoundation;

namespace {

struct Fatal : std::runtime_error {
  using runtime_error::runtime_error;
};

void require(bool condition) {
  if (!condition) std::abort();
}

/// The conditions that a document may end in, and no other.
bool isStated(std::string_view message) {
  return message == "A 'sections' element must have at least one 'code' element!" ||
         message == "Every page of a marlet with several pages must have a name!";
}

/// The next piece of the input, up to a byte that no manifest has.
std::string_view piece(std::string_view& input) {
  const auto text = input.substr(0, input.find('\x1e'));
  input.remove_prefix(std::min(text.size() + 1, input.size()));
  return text;
}

FileWrapper file(std::string_view text) { return FileWrapper::regularFile(Data(std::string(text))); }

/// Adds what lies at a path; a path that ends in "/" is a directory.
void add(FileWrapper& directory, std::string_view path, std::string_view text) {
  const auto slash = path.find('/');
  const auto name = path.substr(0, slash);
  auto child = directory.child(name);
  if (slash == std::string_view::npos) {
    child = file(text);
  } else if (!child || !child->isDirectory()) {
    child = FileWrapper::directory();
  }
  if (slash != std::string_view::npos && slash + 1 < path.size()) add(*child, path.substr(slash + 1), text);
  child->setPreferredFilename(std::string(name));
  directory.addFileWrapper(*child);
}

void exercise(const FileWrapper& tree) {
  // There is nothing at this place: directories and icons are left out when the document is written.
  const auto url = URL::file("/nowhere/at/all/D.marlet", true);
  const MarletSnapshot marlet(tree, url);
  require(!marlet.pages.empty() && Marlet(marlet).snapshot() == marlet);
  const MarletSnapshot again(marlet.fileWrapper(), url);
  require(again.pages.size() == marlet.pages.size() && again.target == marlet.target);
  require(again.requiresFullEnvironment == marlet.requiresFullEnvironment);
  for (std::size_t i = 0; i < marlet.pages.size(); ++i) {
    require(again.pages[i].name() == marlet.pages[i].name() &&
            again.pages[i].text() == marlet.pages[i].text());
  }
}

}  // namespace

/// Pieces: the manifest, then paths and contents of files by turns.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  static const bool isSetUp = [] {
    auto environment = HostEnvironment::defaults();
    environment.diagnostics = [](std::string_view) {};
    environment.systemLog = [](std::string_view) {};
    HostEnvironment::setCurrent(std::move(environment));
    setFatalErrorHandler([](std::string_view message, const auto&) {
      if (isStated(message)) throw Fatal(std::string(message));
    });
    return true;
  }();
  require(isSetUp);
  std::string_view input(reinterpret_cast<const char*>(bytes), size);
  const auto manifest = piece(input);
  auto tree = FileWrapper::directory();
  while (!input.empty()) {
    const auto path = piece(input);
    add(tree, path, piece(input));
  }
  add(tree, "contents.wbmarlet", manifest);
  try {
    exercise(tree);
  } catch (const Error&) {
  } catch (const Fatal&) {
  }
  return 0;
}
