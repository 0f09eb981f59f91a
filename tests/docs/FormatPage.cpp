#include "docs/FormatPage.h"

#include <fstream>
#include <regex>
#include <sstream>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Platform/JSONSerialization.h"

namespace MarletFoundation::test {
namespace {

using Cells = std::vector<std::string>;

/// The contents of a cell that is one code span and nothing else: an answer. Another cell stands for none.
std::string codeSpan(const std::string& cell) {
  const bool isSpan = cell.size() > 2 && cell.find('`') == 0 && cell.find('`', 1) == cell.size() - 1;
  return isSpan ? cell.substr(1, cell.size() - 2) : "";
}

Cells cellsOf(const std::string& line) {
  static const std::regex bar(R"(\s*\|\s*)");
  return {std::sregex_token_iterator(line.begin() + 2, line.end(), bar, -1), {}};
}

std::string withoutSlash(const std::string& path) { return path.substr(0, path.find_last_not_of('/') + 1); }

PropertyListValue valueFromJSON(const std::string& json) {
  return propertyListValue(JSONSerialization::read(Data(json))).value();
}

/// The dictionary at a path of keys and indices.
PropertyListDictionary& dictionaryAt(PropertyListValue& root, const std::string& place) {
  auto* value = &root;
  std::istringstream steps(place);
  for (std::string step; std::getline(steps, step, '/');) {
    value = value->array() ? &std::get<PropertyListValue::Array>(value->payload).at(std::stoul(step))
                           : &std::get<PropertyListDictionary>(value->payload)[step];
  }
  return std::get<PropertyListDictionary>(value->payload);
}

/// Makes claims of the rows of one table.
class TableReader {
 public:
  TableReader(const FormatPage& page, std::vector<FormatPage::Claim>& claims)
      : page_(page), claims_(claims) {}

  /// False when the line begins no table.
  bool begin(const std::string& line) {
    static const std::pair<std::regex, Row> kinds[] = {
        {std::regex("Paths in `(.+)`:"), &TableReader::path},
        {std::regex("Keys of `([^`]+)`(?: at `(.+)`)?:"), &TableReader::key},
        {std::regex("Values of `([^`]+)`(?: at `(.+)`)? that are refused:"), &TableReader::value},
        {std::regex("Attributes of `(.+)` in `(.+)`:"), &TableReader::attribute},
        {std::regex("Contents of `(.+)` that are refused:"), &TableReader::contents},
    };
    for (const auto& [pattern, row] : kinds) {
      std::smatch match;
      if (!std::regex_match(line, match, pattern)) continue;
      line_ = line;
      first_ = match[1];
      second_ = match.size() > 2 ? match[2].str() : "";
      row_ = row;
      return true;
    }
    return false;
  }

  void read(Cells cells) {
    for (std::size_t i = 1; i < cells.size(); ++i) {
      if (cells[i] == "the same") cells[i] = cells[i - 1];
    }
    if (!row_) throw std::runtime_error("A table without a line that says what it is about: " + cells[0]);
    (this->*row_)(cells);
  }

 private:
  using Row = void (TableReader::*)(const Cells&);

  void claim(const Cells& cells, const std::string& change, Tree changed, const std::string& answer) {
    claims_.push_back({line_ + " " + cells[0] + change, std::move(changed), codeSpan(answer)});
  }

  // Path, kind, needed, meaning, without it, of another kind.
  void path(const Cells& cells) {
    const auto name = codeSpan(cells.at(0));
    const auto path = first_ + "/" + withoutSlash(name);
    const auto without = page_.example().without(path).with(path.substr(0, path.rfind('/') + 1), "");
    claim(cells, " missing", without, cells.at(4));
    claim(cells, " of another kind",
          name.ends_with('/') ? without.with(path, "a file") : without.with(path + "/", ""), cells.at(5));
  }

  // Key, type, needed, meaning, without it, of another type.
  void key(const Cells& cells) {
    const auto key = codeSpan(cells.at(0));
    const auto change = [&](auto how) {
      auto root = propertyList(first_);
      how(dictionaryAt(root, second_));
      return page_.example().with(first_, root);
    };
    claim(cells, " missing", change([&](auto& place) { place.erase(key); }), cells.at(4));
    claim(cells, " of another type",
          change([&](auto& place) { place[key] = cells.at(1) == "integer" ? PropertyListValue("7") : 7; }),
          cells.at(5));
  }

  // Key, value, answer.
  void value(const Cells& cells) {
    auto root = propertyList(first_);
    dictionaryAt(root, second_)[codeSpan(cells.at(0))] = valueFromJSON(codeSpan(cells.at(1)));
    claim(cells, " " + cells[1], page_.example().with(first_, root), cells.at(2));
  }

  // Attribute, needed, meaning, without it, with "?" for its value.
  void attribute(const Cells& cells) {
    const auto name = codeSpan(cells.at(0));
    const auto without = std::regex_replace(
        page_.files.at(second_), std::regex("(<" + first_ + R"(\b[^>]*?)\s+)" + name + R"(="[^"]*")"), "$1",
        std::regex_constants::format_first_only);
    const auto strange =
        std::regex_replace(without, std::regex("<" + first_ + R"(\b)"), "$& " + name + R"(="?")",
                           std::regex_constants::format_first_only);
    claim(cells, " missing", page_.example().with(second_, without), cells.at(3));
    claim(cells, " as ?", page_.example().with(second_, strange), cells.at(4));
  }

  // Contents, answer.
  void contents(const Cells& cells) {
    claim(cells, "", page_.example().with(first_, codeSpan(cells.at(0))), cells.at(1));
  }

  PropertyListValue propertyList(const std::string& file) const {
    return fromPropertyListData<PropertyListValue>(Data(page_.files.at(file)));
  }

  const FormatPage& page_;
  std::vector<FormatPage::Claim>& claims_;
  std::string line_, first_, second_;
  Row row_ = nullptr;
};

}  // namespace

FormatPage::FormatPage(const std::string& name) {
  std::ifstream stream(std::string(MARLET_FORMAT_PAGES "/") + name);
  text.assign(std::istreambuf_iterator<char>(stream), {});
  readFiles();
  TableReader table(*this, claims);
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    if (table.begin(line)) continue;
    if (line.starts_with("| `")) table.read(cellsOf(line));
  }
}

void FormatPage::readFiles() {
  static const std::regex heading("`([^`]+)`:");
  std::istringstream lines(text);
  std::string* file = nullptr;
  for (std::string line; std::getline(lines, line);) {
    std::smatch match;
    if (std::regex_match(line, match, heading)) {
      file = &files[match[1]];
    } else if (line.starts_with("```")) {
      while (std::getline(lines, line) && line != "```") {
        if (file) *file += line + "\n";
      }
      file = nullptr;
    }
  }
}

Tree FormatPage::example() const {
  Tree tree;
  for (const auto& [path, contents] : files) tree = tree.with(path, contents);
  return tree;
}

}  // namespace MarletFoundation::test
