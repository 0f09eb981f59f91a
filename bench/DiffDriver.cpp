// What `git diff`, `git merge-file` and `diff -rq` do, in a process of its own that links nothing but what that takes.
//
//   diff OLD NEW    merge BASE OURS THEIRS    trees OLD NEW
#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletDiff/RecursiveFileDiff.h"
#include "MarletFoundation/Platform/FileManager.h"

using namespace MarletDiff;
using MarletFoundation::URL;

int main(int, char** argv) {
  const auto smaller = DiffOptions::SmallerHunks;
  const auto text = [&](int argument) {
    return MarletFoundation::FileManager::mapFile(URL::file(argv[argument]));
  };
  const std::string_view what = argv[1];
  if (what == "trees") {
    const auto changes = recursiveFileDiff(URL::file(argv[2], true), URL::file(argv[3], true), smaller);
    return changes.empty() ? 0 : 1;
  }
  const auto base = text(2);
  const auto diff = diffContent(base.view(), text(3).view(), smaller);
  if (what == "diff") return diff.empty() ? 0 : 1;
  return mergeContent(base.view(), diff, diffContent(base.view(), text(4).view(), smaller)).empty() ? 1 : 0;
}
