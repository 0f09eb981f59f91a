#pragma once

#include <string>

#include "Ending.h"
#include "MarletFoundation/MarletFoundation.h"

enum class DocumentKind { book, classic, unknown };

/// A document as the command line names it: a path and what lies there.
struct Document {
  std::string path;
  MarletFoundation::URL url;
  MarletFoundation::FileWrapper wrapper;
  DocumentKind kind;

  /// Throws the file error when the path can't be read at all.
  explicit Document(const std::string& path);

  /// Whether what was read of it is one state, or doesn't matter any more since our change is made.
  bool isUnchanged() const { return isChangeMade() || wrapper.isUnchanged(); }
};
