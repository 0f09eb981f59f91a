#pragma once

#include <CLI/CLI.hpp>
#include <string>
#include <utility>
#include <vector>

/// What the command takes, read off its parser: the manual page and the completions are made from it, so that they
/// say what is so. The type name of an option or operand tells what may stand there: FILE, DIR, or words to choose
/// from; anything else is a text of the reader's own.

enum class OperandKind { none, text, file, directory, choice };

/// An option or, where it has no flags, an operand that stands by itself.
struct OptionRow {
  std::vector<std::string> flags;
  /// What the reader puts there: "FILE", "auto|always|never", or nothing for a switch.
  std::string operand;
  OperandKind kind = OperandKind::none;
  std::vector<std::string> choices;
  std::string help;
  bool isRequired = false;
  bool isRepeatable = false;
};

struct CommandRow {
  /// Its words after the program's name: none for the program itself, "new" and "page" for `marlet new page`.
  std::vector<std::string> words;
  std::string help;
  std::vector<OptionRow> options;
  std::vector<OptionRow> operands;
  /// Names of the commands right below it, with their help.
  std::vector<std::pair<std::string, std::string>> subcommands;

  /// Its words, each behind a blank: what a completion script has of a line that came to this command.
  std::string key() const;
};

/// A row for the program and each command that isn't hidden, parents first. The program's options are taken everywhere.
std::vector<CommandRow> optionTable(const CLI::App& app);

/// Words that an option takes and what each stands for. The option shows them as "one|two".
template <class Value>
void offerChoices(CLI::Option* option, const std::vector<std::pair<std::string, Value>>& choices) {
  std::string names;
  for (const auto& choice : choices) names += (names.empty() ? "" : "|") + choice.first;
  option->transform(CLI::CheckedTransformer(choices).description(""))->type_name(names);
}

/// The options that a command takes: its own, and the program's.
std::vector<OptionRow> optionsTaken(const CommandRow& command, const std::vector<CommandRow>& table);

std::string joined(const std::vector<std::string>& words, std::string_view separator);
