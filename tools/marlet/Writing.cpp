#include "Writing.h"

#include <filesystem>

#include "Ending.h"
#include "Guarded.h"
#include "MarletFoundation/Platform/Text.h"

using namespace MarletFoundation;

void requireFilename(const std::string& name) {
  if (name.empty() || name.starts_with('.') || name.find('/') != std::string::npos || !isValidUTF8(name))
    throw CommandFailure{ExitStatus::wrongUsage, name + ": This can't be the name of a directory."};
}

void refuseToOverwrite(const std::string& name) {
  throw CommandFailure{ExitStatus::failedWrite, name + ": There is something of that name already."};
}

void requireNothingAt(const std::string& path) {
  const auto place = URL::file(path, true).standardized().path();
  std::error_code unknown;
  if (std::filesystem::symlink_status(place, unknown).type() != std::filesystem::file_type::not_found)
    refuseToOverwrite(path);
}

void writeTree(const FileWrapper& tree, const URL& url, ExistingItem existing) {
  commit(url.path(), [&] { tree.write(url, existing); });
}
