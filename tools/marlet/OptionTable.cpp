#include "OptionTable.h"

#include <algorithm>

namespace {

OptionRow makeRow(const CLI::Option& option) {
  OptionRow row;
  for (const auto& name : option.get_snames()) row.flags.push_back("-" + name);
  for (const auto& name : option.get_lnames()) row.flags.push_back("--" + name);
  row.help = option.get_description();
  row.isRequired = option.get_required();
  if (option.get_items_expected_max() == 0) return row;

  const auto type = option.get_type_name();
  row.isRepeatable = option.get_expected_max() > 1;
  row.operand = row.flags.empty() ? option.get_name() : type;
  if (type.find('|') != std::string::npos) {
    row.kind = OperandKind::choice;
    row.choices = CLI::detail::split(type, '|');
  } else {
    row.kind = type == "FILE"  ? OperandKind::file
               : type == "DIR" ? OperandKind::directory
                               : OperandKind::text;
  }
  return row;
}

void addRows(const CLI::App& app, const std::vector<std::string>& words, std::vector<CommandRow>& table) {
  CommandRow row{words, app.get_description(), {}, {}, {}};
  for (const auto* option : app.get_options()) {
    auto optionRow = makeRow(*option);
    auto& rows = optionRow.flags.empty() ? row.operands : row.options;
    rows.push_back(std::move(optionRow));
  }
  const auto subcommands =
      app.get_subcommands([](const CLI::App* command) { return !command->get_group().empty(); });
  for (const auto* command : subcommands)
    row.subcommands.emplace_back(command->get_name(), command->get_description());
  table.push_back(std::move(row));
  for (const auto* command : subcommands) {
    auto deeper = words;
    deeper.push_back(command->get_name());
    addRows(*command, deeper, table);
  }
}

}  // namespace

std::string CommandRow::key() const { return words.empty() ? "" : " " + joined(words, " "); }

std::vector<CommandRow> optionTable(const CLI::App& app) {
  std::vector<CommandRow> table;
  addRows(app, {}, table);
  return table;
}

std::vector<OptionRow> optionsTaken(const CommandRow& command, const std::vector<CommandRow>& table) {
  auto options = command.options;
  if (command.words.empty()) return options;
  for (const auto& option : table.front().options) {
    const auto isSame = [&](const OptionRow& own) { return own.flags == option.flags; };
    if (std::none_of(command.options.begin(), command.options.end(), isSame)) options.push_back(option);
  }
  return options;
}

std::string joined(const std::vector<std::string>& words, std::string_view separator) {
  std::string all;
  for (const auto& word : words) {
    if (!all.empty()) all += separator;
    all += word;
  }
  return all;
}
