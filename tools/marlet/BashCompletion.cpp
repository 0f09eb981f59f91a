#include "Reference.h"

namespace {

std::string inQuotes(const std::string& text) { return "\"" + text + "\""; }

/// Patterns that match an option where the script meets it, "COMMAND FLAG".
std::string flagPatterns(const CommandRow& command, const OptionRow& option) {
  std::string patterns;
  for (const auto& flag : option.flags) {
    if (!patterns.empty()) patterns += " | ";
    patterns += (command.words.empty() ? "*" : "") + inQuotes(command.key() + " " + flag);
  }
  return patterns;
}

std::string answer(const OptionRow& row, const std::vector<std::string>& otherWords = {}) {
  auto words = otherWords;
  words.insert(words.end(), row.choices.begin(), row.choices.end());
  std::string arguments;
  if (!words.empty()) arguments += " -W '" + joined(words, " ") + "'";
  if (row.kind == OperandKind::file) arguments += " -f";
  if (row.kind == OperandKind::directory) arguments += " -d";
  return arguments.empty() ? ":" : "_marlet_answer" + arguments;
}

void printWalk(const std::vector<CommandRow>& table, std::ostream& out) {
  out << "  for ((i = 1; i < COMP_CWORD; ++i)); do\n"
      << "    case \"$command ${COMP_WORDS[i]}\" in\n      ";
  std::string commands;
  std::vector<std::string> values;
  for (const auto& command : table) {
    if (!command.words.empty()) commands += (commands.empty() ? "" : " | ") + inQuotes(command.key());
    for (const auto& option : command.options)
      if (!option.operand.empty()) values.push_back(flagPatterns(command, option));
  }
  out << commands << ")\n        command+=\" ${COMP_WORDS[i]}\" operands=0 ;;\n      "
      << joined(values, " | ")
      << ")\n        [[ ${COMP_WORDS[i + 1]} == = ]] && ((++i))\n        ((++i)) ;;\n"
      << "      *\" -\"?*) ;;\n      *) ((++operands)) ;;\n    esac\n  done\n";
}

void printValues(const std::vector<CommandRow>& table, std::ostream& out) {
  out << "  case \"$command $previous\" in\n";
  for (const auto& command : table)
    for (const auto& option : command.options)
      if (!option.operand.empty())
        out << "    " << flagPatterns(command, option) << ") " << answer(option) << "; return ;;\n";
  out << "  esac\n";
}

void printFlags(const std::vector<CommandRow>& table, std::ostream& out) {
  out << "  if [[ $current == -* ]]; then\n    case $command in\n";
  for (const auto& command : table) {
    std::vector<std::string> flags;
    for (const auto& option : optionsTaken(command, table))
      flags.insert(flags.end(), option.flags.begin(), option.flags.end());
    out << "      " << inQuotes(command.key()) << ") _marlet_answer -W '" << joined(flags, " ") << "' ;;\n";
  }
  out << "    esac\n    return\n  fi\n";
}

void printOperands(const std::vector<CommandRow>& table, std::ostream& out) {
  out << "  case \"$command:$operands\" in\n";
  for (const auto& command : table) {
    std::vector<std::string> names;
    for (const auto& subcommand : command.subcommands) names.push_back(subcommand.first);
    auto operands = command.operands;
    if (operands.empty() && !names.empty()) operands.emplace_back();
    for (std::size_t i = 0; i < operands.size(); ++i) {
      const auto place = operands[i].isRepeatable ? inQuotes(command.key() + ":") + "*"
                                                  : inQuotes(command.key() + ":" + std::to_string(i));
      out << "    " << place << ") " << answer(operands[i], i == 0 ? names : std::vector<std::string>())
          << " ;;\n";
    }
  }
  out << "  esac\n";
}

}  // namespace

void printBashCompletion(const std::vector<CommandRow>& table, std::ostream& out) {
  out << "# Completion of marlet's command line, made from its option table.\n\n"
      << "_marlet_answer() {\n"
      << "  [[ \" $* \" == *' -'[df]' '* ]] && compopt -o filenames 2>/dev/null\n"
      << "  mapfile -t COMPREPLY < <(compgen \"$@\" -- \"$current\")\n}\n\n"
      << "_marlet() {\n"
      << "  local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]}\n"
      << "  local command= operands=0 i\n"
      << "  COMPREPLY=()\n"
      << "  # --flag=value comes as three words.\n"
      << "  if [[ $current == = ]]; then\n    current=\n"
      << "  elif [[ $previous == = ]]; then\n    previous=${COMP_WORDS[COMP_CWORD - 2]}\n  fi\n";
  printWalk(table, out);
  printValues(table, out);
  printFlags(table, out);
  printOperands(table, out);
  out << "}\n\ncomplete -F _marlet marlet\n";
}
