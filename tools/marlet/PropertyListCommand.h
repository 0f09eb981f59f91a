#pragma once

#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

enum class PropertyListOutput { xml, binary, json };

/// `marlet plist`: reads a property list in either form and writes it in one. "-" is standard input and
/// output.
ExitStatus convertPropertyList(const std::string& input, PropertyListOutput form, const std::string& output,
                               const Terminal& terminal);
