#include "Reference.h"

namespace {

std::string inQuotes(std::string_view text) {
  std::string result = "'";
  for (const char character : text) {
    if (character == '\'' || character == '\\') result += '\\';
    result += character;
  }
  return result + "'";
}

/// The arguments of `complete` for what may stand in an option's or operand's place.
std::string values(const OptionRow& row) {
  switch (row.kind) {
    case OperandKind::none:
      return "";
    case OperandKind::text:
      return " -x";
    case OperandKind::file:
      return " -r -F";
    case OperandKind::directory:
      return " -x -a '(__fish_complete_directories)'";
    case OperandKind::choice:
      return " -x -a " + inQuotes(joined(row.choices, " "));
  }
  return "";
}

void printPlace(const std::vector<CommandRow>& table, std::ostream& out) {
  std::vector<std::string> commands, flags;
  for (const auto& command : table) {
    if (!command.words.empty()) commands.push_back(inQuotes(command.key()));
    for (const auto& option : command.options)
      for (const auto& flag : option.flags)
        if (!option.operand.empty())
          flags.push_back(inQuotes((command.words.empty() ? "*" : command.key()) + " " + flag));
  }
  out << "# Whether the line has come to a command, and to an operand of it where one is given.\n"
      << "function __marlet_at\n"
      << "  set -l words (commandline -opc)\n  set -e words[1]\n"
      << "  set -l command ''\n  set -l operands 0\n  set -l isValue 0\n"
      << "  for word in $words\n"
      << "    if test $isValue = 1\n      set isValue 0\n      continue\n    end\n"
      << "    switch \"$command $word\"\n"
      << "      case " << joined(commands, " ")
      << "\n        set command \"$command $word\"\n        set operands 0\n"
      << "      case " << joined(flags, " ") << "\n        set isValue 1\n"
      << "      case '* -?*'\n"
      << "      case '*'\n        set operands (math $operands + 1)\n"
      << "    end\n  end\n"
      << "  test \"$command\" = \"$argv[1]\"; and begin\n"
      << "    not set -q argv[2]; or test $operands = $argv[2]\n  end\n"
      << "end\n\n";
}

void printOption(const OptionRow& option, const std::string& condition, std::ostream& out) {
  out << "complete -c marlet" << condition;
  for (const auto& flag : option.flags)
    out << (flag.starts_with("--") ? " -l " + flag.substr(2) : " -s " + flag.substr(1));
  out << values(option) << " -d " << inQuotes(option.help) << "\n";
}

void printOperands(const CommandRow& command, std::ostream& out) {
  for (std::size_t i = 0; i < command.operands.size(); ++i) {
    const auto& operand = command.operands[i];
    if (operand.kind == OperandKind::text) continue;
    auto place = "__marlet_at " + inQuotes(command.key());
    if (!operand.isRepeatable) place += " " + std::to_string(i);
    const auto offered = operand.kind == OperandKind::file ? " -F" : values(operand);
    out << "complete -c marlet -n \"" << place << "\"" << offered << "\n";
  }
}

}  // namespace

void printFishCompletion(const std::vector<CommandRow>& table, std::ostream& out) {
  out << "# Completion of marlet's command line, made from its option table.\n\n";
  printPlace(table, out);
  out << "complete -c marlet -f\n";
  for (const auto& command : table) {
    // The program's own options are offered everywhere.
    const auto condition = command.words.empty() ? "" : " -n \"__marlet_at " + inQuotes(command.key()) + "\"";
    for (const auto& [name, help] : command.subcommands)
      out << "complete -c marlet -n \"__marlet_at " << inQuotes(command.key()) << " 0\" -a " << name << " -d "
          << inQuotes(help) << "\n";
    for (const auto& option : command.options) printOption(option, condition, out);
    printOperands(command, out);
  }
}
