#pragma once

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "support/Tree.h"

namespace MarletFoundation::test {

using FileDiff = MarletDiff::FileDiffDescriptor;
using D = PropertyListDictionary;
using A = PropertyListValue::Array;

inline const std::string manifest = "Manifest.plist";
inline const std::string delta = "Pages/text.swift.delta";

/// An entry of a section, or of the modified ones with its delta.
inline PropertyListValue entry(const std::string& path) { return D{{"File", path}}; }
inline PropertyListValue entry(const std::string& path, const std::string& deltaPath) {
  return D{{"File", path}, {"Diff", deltaPath}};
}

inline PropertyListValue hunkEntry() {
  return D{{"OriginalRange", "{2, 3}"},
           {"ModifiedRange", "{2, 4}"},
           {"OriginalContent", "one"},
           {"ModifiedContent", "zwei"}};
}

/// A learner's pack that opens, with one entry of each kind.
inline Tree goodPack() {
  return {{manifest, PropertyListValue(D{{"DiffPackType", "UserEdit"},
                                         {"DocumentType", "MarletBook"},
                                         {"Name", "org.example.loops"},
                                         {"BaseVersion", "1.0"},
                                         {"UpdateVersion", "1.0.1"},
                                         {"Updates", D{{"Added", A{entry("new.txt")}},
                                                       {"Removed", A{entry("old.txt")}},
                                                       {"Replaced", A{entry("Pages/image.png")}},
                                                       {"Modified", A{entry("Pages/text.swift", delta)}}}}})},
          {"new.txt", std::string("new")},
          {"Pages/image.png", std::string("\x89PNG")},
          {delta, PropertyListValue(D{{"File", "Pages/text.swift"}, {"Diff", A{hunkEntry()}}})}};
}

inline std::vector<FileDiff> entries(const DiffPackSnapshot& pack) {
  return {pack.updates.begin(), pack.updates.end()};
}

}  // namespace MarletFoundation::test
