#include "Reference.h"

namespace {

std::string inQuotes(std::string_view text) {
  std::string result = "'";
  for (const char character : text) {
    if (character == '\'') {
      result += "'\\''";
    } else {
      result += character;
    }
  }
  return result + "'";
}

/// With a backslash before each of some characters.
std::string escaped(std::string_view text, std::string_view special) {
  std::string result;
  for (const char character : text) {
    if (special.find(character) != std::string_view::npos) result += '\\';
    result += character;
  }
  return result;
}

std::string functionName(const CommandRow& command) {
  return command.words.empty() ? "_marlet" : "_marlet_" + joined(command.words, "_");
}

/// ":what is asked for:what completes it".
std::string operandForm(const OptionRow& row) {
  auto form = ":" + escaped(row.operand, ":\\") + ":";
  switch (row.kind) {
    case OperandKind::none:
    case OperandKind::text:
      return form;
    case OperandKind::file:
      return form + "_files";
    case OperandKind::directory:
      return form + "_files -/";
    case OperandKind::choice:
      return form + "(" + joined(row.choices, " ") + ")";
  }
  return form;
}

void printOption(const OptionRow& option, std::ostream& out) {
  const auto exclusion = option.isRepeatable ? std::string("*") : "(" + joined(option.flags, " ") + ")";
  for (const auto& flag : option.flags) {
    auto form = exclusion + flag;
    if (!option.operand.empty()) form += flag.starts_with("--") ? "=" : "+";
    form += "[" + escaped(option.help, "[]\\") + "]";
    if (!option.operand.empty()) form += operandForm(option);
    out << " \\\n    " << inQuotes(form);
  }
}

void printCommandCases(const CommandRow& command, std::ostream& out) {
  out << " \\\n    '1: :->command' '*:: :->rest' && return\n"
      << "  case $state in\n    command)\n      commands=(";
  for (const auto& [name, help] : command.subcommands)
    out << "\n        " << inQuotes(escaped(name + ":" + help, "\\"));
  out << ")\n      _describe command commands";
  if (!command.operands.empty())
    out << "\n      _files" << (command.operands.front().kind == OperandKind::directory ? " -/" : "");
  out << " ;;\n    rest)\n      case $words[1] in\n";
  for (const auto& subcommand : command.subcommands)
    out << "        " << subcommand.first << ") " << functionName(command) << "_" << subcommand.first
        << " ;;\n";
  out << "      esac ;;\n  esac\n";
}

void printFunction(const CommandRow& command, const std::vector<CommandRow>& table, std::ostream& out) {
  out << functionName(command) << "() {\n";
  if (!command.subcommands.empty()) out << "  local curcontext=$curcontext state line\n  local -a commands\n";
  out << "  _arguments " << (command.subcommands.empty() ? "-s" : "-C -s");
  for (const auto& option : optionsTaken(command, table)) printOption(option, out);
  if (!command.subcommands.empty()) {
    printCommandCases(command, out);
  } else {
    for (std::size_t i = 0; i < command.operands.size(); ++i) {
      const auto place = command.operands[i].isRepeatable ? "*" : std::to_string(i + 1);
      out << " \\\n    " << inQuotes(place + operandForm(command.operands[i]));
    }
    out << "\n";
  }
  out << "}\n\n";
}

}  // namespace

void printZshCompletion(const std::vector<CommandRow>& table, std::ostream& out) {
  out << "#compdef marlet\n# Completion of marlet's command line, made from its option table.\n\n";
  for (const auto& command : table) printFunction(command, table, out);
  out << "_marlet \"$@\"\n";
}
