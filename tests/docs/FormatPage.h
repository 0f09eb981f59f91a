#pragma once

#include <map>
#include <string>
#include <vector>

#include "support/Tree.h"

namespace MarletFoundation::test {

/// A page of docs/formats as a test reads it. Its files stand in fenced blocks, each behind a line that names the
/// file; its tables stand behind a line that says what they are about.
struct FormatPage {
  /// What a table's row says happens to the example once it is changed.
  struct Claim {
    /// The table's line and the row's first cell.
    std::string subject;
    Tree changed;
    /// The system's words, or the name of its error; empty where the example still opens.
    std::string answer;
  };

  std::string text;
  std::map<std::string, std::string> files;
  std::vector<Claim> claims;

  /// Throws for a page that isn't written as its tables' lines ask for.
  explicit FormatPage(const std::string& name);

  Tree example() const;

 private:
  void readFiles();
};

}  // namespace MarletFoundation::test
