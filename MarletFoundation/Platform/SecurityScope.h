#pragma once

#include <optional>
#include <string>

#include "MarletFoundation/Platform/URL.h"

/// Grants to read one file, which one process makes and another of the same user takes up. A grant is a token: a
/// text that names the access, the file itself and the place where it lies, with all links on the way followed, and
/// is signed with a secret of the user's own, so that nobody can make or widen one who can't read the user's files
/// anyway. A file that took the place of another, or a way that leads elsewhere by now, isn't what it was given for.
/// The secret lies in the application-support directory.
namespace MarletFoundation::SecurityScope {

/// Whether the last name of the path is a symbolic link's, however many "." stand behind it. Nothing, with errno set,
/// when that can't be told, as for a path that ends in "..".
MARLET_EXPORT std::optional<bool> isSymbolicLink(const std::string& path);

/// A token for reading what lies at the path; nothing, with errno set, when that can't be read, is a symbolic link or
/// the secret can't be had.
MARLET_EXPORT std::optional<std::string> issueSandboxExtension(const std::string& path);

/// The token that the URL carries, or nothing.
MARLET_EXPORT std::optional<std::string> copySecurityScope(const URL& url);
MARLET_EXPORT URL attachSecurityScope(const URL& url, std::string token);

/// Whether the URL carries a good token, and what lies at its path is still the file that it was given for, in the same
/// place, and can be read. Each start that answers true is to be followed by one stop.
MARLET_EXPORT bool startAccessingSecurityScopedResource(const URL& url);
MARLET_EXPORT void stopAccessingSecurityScopedResource(const URL& url);
/// How many starts of the path in this process still wait for their stop.
MARLET_EXPORT std::size_t accessCount(const URL& url);

}  // namespace MarletFoundation::SecurityScope
