#pragma once

#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

/// Expands a zip archive into a directory, which is made when missing, and says what of it was refused.
ExitStatus unzip(const std::string& archive, const std::string& directory, const Terminal& terminal);
