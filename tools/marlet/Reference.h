#pragma once

#include <CLI/CLI.hpp>
#include <ostream>

#include "OptionTable.h"

/// What is printed of the option table for others to read.
enum class Reference { manualPage, bash, zsh, fish };

void printReference(const CLI::App& app, Reference reference, std::ostream& out);

void printManualPage(const std::vector<CommandRow>& table, std::ostream& out);
void printBashCompletion(const std::vector<CommandRow>& table, std::ostream& out);
void printZshCompletion(const std::vector<CommandRow>& table, std::ostream& out);
void printFishCompletion(const std::vector<CommandRow>& table, std::ostream& out);
