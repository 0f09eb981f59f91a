#pragma once

#include <string>
#include <vector>

/// Runs a program to its end with its output thrown away, and gives back the seconds of processor time that it
/// took, its start included. Ends this process when the program fails.
double processorTimeOf(const std::vector<std::string>& command);

/// The path of `marlet` as it was built beside this program.
std::string marletProgram();
