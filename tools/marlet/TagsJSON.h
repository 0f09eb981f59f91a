#pragma once

#include <nlohmann/json.hpp>
#include <string_view>

/// All that the library reads in a page's source; offsets and lengths in UTF-16 units.
nlohmann::ordered_json tagsJSON(std::u16string_view source);
