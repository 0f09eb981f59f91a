// What `git diff`, `git merge-file` and `diff -rq` do, in a process of its own that links nothing but what that takes.
//
//   diff OLD NEW    merge BASE OURS THEIRS    trees OLD NEW
#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletDiff/RecursiveFileDiff.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Text.h"

using namespace MarletDiff;
using MarletFoundation::URL;

int main(int, char** argv) {
  const auto smaller = DiffOptions::SmallerHunks;
  const auto text = [&](int argument) {
    return *MarletFoundation::utf16FromUTF8(
        MarletFoundation::FileManager::mapFile(URL::file(argv[argument])).view());
  };
  const std::string_view what = argv[1];
  if (what == "trees") {
    const auto changes = recursiveFileDiff(URL::file(argv[2], true), URL::file(argv[3], true), smaller);
    return changes.empty() ? 0 : 1;
  }
  const auto base = text(2);
  const auto diff = diffContent(base, text(3), smaller);
  if (what == "diff") return diff.empty() ? 0 : 1;
  return mergeContent(base, diff, diffContent(base, text(4), smaller)).empty() ? 1 : 0;
}
