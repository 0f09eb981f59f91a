#pragma once

#include <string>

#include "MarletFoundation/Platform/FileWrapper.h"

enum class DocumentKind { book, classic, unknown };

/// A document as the command line names it: a path and what lies there.
struct Document {
  std::string path;
  MarletFoundation::URL url;
  MarletFoundation::FileWrapper wrapper;
  DocumentKind kind;

  /// Throws the file error when the path can't be read at all.
  explicit Document(const std::string& path);
};
