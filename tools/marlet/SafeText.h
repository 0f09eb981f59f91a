#pragma once

#include <string>
#include <string_view>

/// What the command prints comes from documents, file names and arguments, whose author may mean to steer the
/// terminal or to show a reader another text than there is. Unsafe are controls (up to U+001F and from U+007F to
/// U+009F), characters that turn the direction of writing (U+061C, U+200E, U+200F, U+202A to U+202E, U+2066 to
/// U+206F), the separators U+2028 and U+2029, and bytes that are no UTF-8.

/// A text for a place within a line: unsafe ASCII and bytes become `\x1B`, other unsafe characters `\u202E`.
std::string printable(std::string_view text);
/// The same for a whole text: its ends of lines and tabs stay.
std::string printableLines(std::string_view text);
/// The same for what the command itself has put together: its own colours stay as well.
std::string printableOutput(std::string_view output);
/// JSON in UTF-8, what is unsafe in its strings as JSON's own escapes.
std::string printableJSON(std::string_view json);
