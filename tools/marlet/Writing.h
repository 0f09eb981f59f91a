#pragma once

#include <string>

#include "MarletFoundation/Platform/FileWrapper.h"

/// What commands that make documents have in common. Each throws `CommandFailure`.

/// A name from the command line that is to name a directory.
void requireFilename(const std::string& name);
[[noreturn]] void refuseToOverwrite(const std::string& name);
/// Refuses a path that something lies at, were it a link to nowhere.
void requireNothingAt(const std::string& path);
/// Writes a whole tree or nothing.
void writeTree(const MarletFoundation::FileWrapper& tree, const MarletFoundation::URL& url,
               MarletFoundation::ExistingItem existing);
