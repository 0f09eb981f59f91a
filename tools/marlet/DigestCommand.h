#pragma once

#include <string>
#include <vector>

#include "ExitStatus.h"
#include "Terminal.h"

/// Prints the digest of each file, MD5 or SHA-1, in the form that md5sum and sha1sum print and check.
ExitStatus printDigests(const std::vector<std::string>& paths, bool isSHA1, const Terminal& terminal);
