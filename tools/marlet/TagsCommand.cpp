#include "TagsCommand.h"

#include <algorithm>
#include <iostream>
#include <optional>

#include "ErrorWords.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"
#include "SourceLines.h"
#include "TagProblems.h"
#include "TagsJSON.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

/// What an editor makes of a line; the later mark wins.
enum class Mark { none, editable, hidden, directive };

void mark(std::vector<Mark>& marks, std::size_t first, std::size_t last, Mark value) {
  for (auto line = first; line <= last && line < marks.size(); ++line)
    marks[line] = std::max(marks[line], value);
}

std::vector<Mark> marksOf(std::u16string_view source, const SourceLines& lines) {
  std::vector<Mark> marks(lines.count(), Mark::none);
  for (const auto& range : editableRanges(source)) {
    if (range.length > 0)
      mark(marks, lines.indexAt(range.location), lines.indexAt(range.end() - 1), Mark::editable);
  }
  std::size_t hiddenFrom = 0;
  for (const auto& [range, tag] : SourceTag::parseStringForValidTags(source).tags) {
    const auto line = lines.indexAt(range.location);
    if (tag.kind() == SourceTag::Case::hiddenCodeStart) hiddenFrom = line;
    if (tag.kind() == SourceTag::Case::hiddenCodeEnd) mark(marks, hiddenFrom, line, Mark::hidden);
    if (tag.isLineTag() && tag.isCopySource()) mark(marks, line, line, Mark::hidden);
    if (tag.kind() == SourceTag::Case::codeCompletionDirective) mark(marks, line, line, Mark::directive);
  }
  return marks;
}

std::string_view name(Mark mark) {
  constexpr std::string_view names[] = {"         ", "editable ", "hidden   ", "directive"};
  return names[static_cast<std::size_t>(mark)];
}

/// A piece of the source for the terminal, tabs as blanks, so that carets meet their place.
std::string shown(std::u16string_view text) {
  auto line = utf8FromUTF16Lossy(text);
  std::replace(line.begin(), line.end(), '\t', ' ');
  return printable(line);
}

/// Units of a line to which marks under it reach; further right, the column's number stands for them.
constexpr std::size_t longestMark = 200;

std::size_t width(std::u16string_view text) { return static_cast<std::size_t>(graphemeCount(shown(text))); }

void printProblem(const Problem& problem, std::u16string_view line, const Terminal& terminal) {
  using Style = Terminal::Style;
  const auto style = problem.severity == "error" ? Style::red : Style::yellow;
  const auto start = static_cast<std::size_t>(*problem.column) - 1;
  const auto length = std::min(static_cast<std::size_t>(*problem.length), longestMark);
  auto place = std::string(name(Mark::none)) + " | ";
  if (start <= longestMark) {
    place.append(width(line.substr(0, start)), ' ');
    const auto tildes = width(line.substr(start, length));
    std::cout << place << terminal.styled(style, "^" + std::string(tildes > 0 ? tildes - 1 : 0, '~')) << "\n";
  } else {
    place += "column " + std::to_string(*problem.column) + ": ";
  }
  std::cout << place << terminal.styled(style, problem.severity + ":") << " "
            << printable(problem.description) << " " << terminal.styled(Style::dim, "[" + problem.rule + "]")
            << "\n";
}

void print(std::u16string_view source, const Terminal& terminal) {
  const SourceLines lines(source);
  const auto marks = marksOf(source, lines);
  const auto problems = tagProblems(source);
  auto problem = problems.begin();
  for (std::size_t index = 0; index < lines.count(); ++index) {
    const auto text = shown(lines.text(index));
    std::cout << terminal.styled(Terminal::Style::dim, std::string(name(marks[index])) + " |")
              << (text.empty() ? "" : " ") << text << "\n";
    for (; problem != problems.end() && *problem->line == static_cast<std::int64_t>(index) + 1; ++problem)
      printProblem(*problem, lines.text(index), terminal);
  }
}

}  // namespace

ExitStatus showTags(const std::vector<std::string>& paths, bool asJSON, const Terminal& terminal) {
  auto status = ExitStatus::good;
  auto report = ordered_json::array();
  const auto fail = [&](const std::string& path, const std::string& reason, ExitStatus failure) {
    terminal.complain(path + ": " + reason);
    report.push_back({{"path", path}, {"error", reason}});
    status = std::max(status, failure);
  };
  for (const auto& path : paths) {
    Data data;
    try {
      data = FileManager::readFile(URL::file(path));
    } catch (const Error& error) {
      fail(path, wordsOf(error), ExitStatus::unreadablePath);
      continue;
    }
    const auto source = utf16FromUTF8(data.view());
    if (!source) {
      fail(path, "The file is not valid UTF-8.", ExitStatus::negative);
      continue;
    }
    if (!SourceTag::hasValidTags(*source)) status = std::max(status, ExitStatus::negative);
    if (asJSON) {
      ordered_json entry{{"path", path}};
      entry.update(tagsJSON(*source));
      report.push_back(std::move(entry));
    } else {
      if (paths.size() > 1)
        std::cout << terminal.styled(Terminal::Style::bold, printable(path) + ":") << "\n";
      print(*source, terminal);
    }
  }
  if (asJSON) std::cout << dumped(report) << "\n";
  return status;
}
