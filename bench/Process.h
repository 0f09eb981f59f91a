#pragma once

#include <string>
#include <vector>

/// Seconds: by the clock, and of processors.
struct ProcessTime {
  double elapsed;
  double processor;
};

/// Runs a program to its end with its output thrown away, and gives back what that took, its start included.
/// Ends this process when the program fails.
ProcessTime timeOf(const std::vector<std::string>& command);

/// The path of `marlet` as it was built beside this program.
std::string marletProgram();

/// The most memory that this process ever held, in bytes.
std::size_t peakMemory();
