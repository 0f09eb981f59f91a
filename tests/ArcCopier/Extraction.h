#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "ArcCopier/ArcCopier.h"
#include "support/Tree.h"

namespace MarletFoundation::test {

/// An archive in a directory of its own, and what came of extracting it into the directory "out" beside it.
class Extraction {
 public:
  explicit Extraction(const std::string& archive, ArcCopierLimits limits = ArcCopierDefaultLimits());

  std::filesystem::path destination() const { return directory_.path() / "out"; }
  /// Extracts, and checks that nothing was made but below the destination, that no passing file is left, and
  /// that nothing has special mode bits.
  void run();

  ArcCopierLimits limits;
  /// Cancels when so many bytes of one file are there.
  std::uint64_t cancelAt = 0;
  /// Called after each block.
  std::function<void()> meanwhile = [] {};
  bool stopsAtErrors = false;
  int result = -1;
  int error = 0;
  std::vector<std::string> started, finished, conflicts;
  /// By path; the whole archive's under "".
  std::map<std::string, std::string> problems;
  /// Contents by path, "/" for directories, "->" for symbolic links.
  std::map<std::string, std::string> files() const;

 private:
  TemporaryDirectory directory_;
};

}  // namespace MarletFoundation::test
