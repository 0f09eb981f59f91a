#include "DigestCommand.h"

#include <unistd.h>

#include <csignal>
#include <iostream>

#include "ErrorWords.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Digest.h"
#include "SafeOutput.h"

using namespace MarletFoundation;

namespace {

std::string complaint;

/// Files are mapped, and who looks at bytes that a file has lost meanwhile gets a signal.
void endAtLostBytes(int) {
  [[maybe_unused]] const auto written = ::write(STDERR_FILENO, complaint.data(), complaint.size());
  ::_exit(static_cast<int>(ExitStatus::unreadablePath));
}

std::string digest(const URL& file, bool isSHA1) {
  if (!isSHA1) return Checksum::MD5ChecksumForFile(file);
  return hexadecimal(FileManager::mapFile(file).mlf_SHA1Digest().bytes());
}

/// A line whose name holds a backslash or an end of line begins with a backslash, and has them as escapes.
std::string line(const std::string& digest, const std::string& name) {
  std::string escaped;
  for (const char c : name) {
    switch (c) {
      case '\\':
        escaped += "\\\\";
        break;
      case '\n':
        escaped += "\\n";
        break;
      case '\r':
        escaped += "\\r";
        break;
      default:
        escaped += c;
    }
  }
  return (escaped == name ? "" : "\\") + digest + "  " + escaped + "\n";
}

}  // namespace

ExitStatus printDigests(const std::vector<std::string>& paths, bool isSHA1, const Terminal& terminal) {
  auto status = ExitStatus::good;
  std::signal(SIGBUS, endAtLostBytes);
  for (const auto& path : paths) {
    complaint = "marlet: " + printable(path) + ": it can't be read to its end.\n";
    try {
      printText(line(digest(URL::file(path), isSHA1), path));
    } catch (const Error& error) {
      terminal.complain(path + ": " + wordsOf(error));
      status = ExitStatus::unreadablePath;
    }
  }
  return status;
}
