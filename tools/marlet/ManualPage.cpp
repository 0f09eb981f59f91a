#include "ExitStatus.h"
#include "MarletFoundation/MarletFoundation.h"
#include "Reference.h"

namespace {

/// Text for roff: a backslash and a hyphen have names, and a line's first character doesn't make it a request.
std::string roff(std::string_view text) {
  std::string escaped;
  if (!text.empty() && (text.front() == '.' || text.front() == '\'')) escaped = "\\&";
  for (const char character : text) {
    if (character == '\\') {
      escaped += "\\e";
    } else if (character == '-') {
      escaped += "\\-";
    } else {
      escaped += character;
    }
  }
  return escaped;
}

std::string bold(std::string_view text) { return "\\fB" + roff(text) + "\\fR"; }

std::string italic(std::string_view text) { return "\\fI" + roff(text) + "\\fR"; }

std::string commandLine(const CommandRow& command) {
  auto line = bold(joined(command.words, " "));
  if (!command.options.empty()) line += " [options]";
  for (const auto& operand : command.operands) {
    auto name = italic(operand.operand);
    if (operand.isRepeatable) name += "...";
    line += operand.isRequired ? " " + name : " [" + name + "]";
  }
  return line;
}

void printRow(const OptionRow& row, std::ostream& out) {
  std::string flags;
  for (const auto& flag : row.flags) flags += (flags.empty() ? "" : ", ") + bold(flag);
  if (!row.operand.empty()) flags += (flags.empty() ? "" : " ") + italic(row.operand);
  out << ".TP\n" << flags << "\n" << roff(row.help);
  if (row.isRequired && !row.flags.empty()) out << "; required";
  if (row.isRepeatable && !row.flags.empty()) out << "; may be given more than once";
  out << ".\n";
}

void printRows(const CommandRow& command, std::ostream& out) {
  for (const auto& row : command.operands) printRow(row, out);
  for (const auto& row : command.options) printRow(row, out);
}

void printVariable(std::string_view name, std::string_view words, std::ostream& out) {
  out << ".TP\n.B " << name << "\n" << roff(words) << "\n";
}

}  // namespace

void printManualPage(const std::vector<CommandRow>& table, std::ostream& out) {
  const auto& program = table.front();
  auto summary = program.help.substr(0, program.help.find_last_not_of('.') + 1);
  summary.front() = static_cast<char>(std::tolower(static_cast<unsigned char>(summary.front())));

  out << ".TH MARLET 1 \"\" \"marlet " << MarletFoundation::MarletFoundationVersionString
      << "\" \"User Commands\"\n"
      << ".SH NAME\nmarlet \\- " << roff(summary) << "\n"
      << ".SH SYNOPSIS\n.B marlet\n[options]\n.I command\n[...]\n"
      << ".SH DESCRIPTION\n"
      << roff(program.help) << "\nResults go to standard output, everything else to standard error.\n"
      << ".SH OPTIONS\nThese may stand before or after the command.\n";
  printRows(program, out);
  out << ".SH COMMANDS\n";
  for (auto command = table.begin() + 1; command != table.end(); ++command) {
    out << ".SS " << commandLine(*command) << "\n" << roff(command->help) << ".\n";
    printRows(*command, out);
  }
  out << ".SH EXIT STATUS\n";
  for (const auto& [status, words] : exitStatusWords)
    out << ".TP\n.B " << static_cast<int>(status) << "\n" << roff(words) << "\n";
  out << ".SH ENVIRONMENT\n";
  printVariable("MARLET_RESOURCES",
                "The directory of the targets and the toolchain, where not that of the installation.", out);
  printVariable("MARLET_DEFAULTS_ArchiveEntryLimit",
                "How many entries an archive may have that unzip takes: 100000 if unset.", out);
  printVariable("MARLET_DEFAULTS_ArchiveByteLimit",
                "How many bytes its files may have together: 4 GiB if unset.", out);
  printVariable(
      "MARLET_DEFAULTS_ArchiveExpansionLimit",
      "How many bytes its files may have for each byte of the archive: 200 if unset. Looked at from 16 MiB "
      "on.",
      out);
  printVariable("NO_COLOR", "Where it is set and not empty, nothing is coloured unless asked for.", out);
}
