#pragma once

#include <span>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// `format` with the conversions of floating-point numbers (`%f`, `%e`, `%g` and their capitals, with the flags
/// "-", "+", " " and "0", a width and a precision of up to three digits) replaced by the arguments in order,
/// and `%%` by a percent sign. The point is always ".". Every other percent sign stays as it stands, and so
/// does a conversion for which no argument is left.
MARLET_EXPORT std::string percentFormatted(std::string_view format, std::span<const double> arguments);

}  // namespace MarletFoundation
