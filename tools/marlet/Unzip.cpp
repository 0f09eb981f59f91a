#include "Unzip.h"

#include <cerrno>

#include "ArcCopier/ArcCopier.h"
#include "Guarded.h"
#include "MarletFoundation/MarletFoundation.h"
#include "ProgressBar.h"

using namespace MarletFoundation;

namespace {

/// Whether an archive that was refused could be read.
bool isDamaged(const ErrorObject& error) {
  return std::get<std::int64_t>(error.userInfo().at("errno")) == EBADMSG;
}

CommandFailure failure(const std::string& archive, const std::string& directory, const ErrorObject& error) {
  switch (error.code()) {
    case ArcCopierBadDestination:
      return {ExitStatus::failedWrite, directory + ": it can't be written to."};
    case ArcCopierSomeFilesFailed:
      return {ExitStatus::negative, archive + ": not everything of it was extracted."};
    case ArcCopierBadArchive:
      return {isDamaged(error) ? ExitStatus::negative : ExitStatus::unreadablePath,
              archive + ": nothing of it was extracted."};
    default:
      return {ExitStatus::negative, archive + ": it was not extracted to its end."};
  }
}

}  // namespace

ExitStatus unzip(const std::string& archive, const std::string& directory, const Terminal& terminal) {
  return guarded(archive, terminal, [&] {
    const auto source = URL::file(archive);
    orFailWith(ExitStatus::unreadablePath, archive, [&] { return FileManager::resourceIsReachable(source); });
    ProgressBar bar(terminal);
    MLFUnzipCopier copier;
    if (bar.isShown()) copier.progressCallback = [&](double fraction, double) { bar.show(fraction); };
    copier.problemCallback = [&](const std::string& path, const std::string& reason) {
      bar.clear();
      terminal.complain((path == source.path() ? archive : path) + ": " + reason + ".");
    };
    std::optional<ErrorObject> error;
    const bool isWhole = copier.unzip(source.path(), URL::file(directory).path(), &error);
    bar.clear();
    if (!isWhole) throw failure(archive, directory, *error);
    if (copier.filenames.empty()) throw UnarchiveError(UnarchiveErrorCase::UnzipFailed);
    return ExitStatus::good;
  });
}
