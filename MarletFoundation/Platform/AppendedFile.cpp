#include "MarletFoundation/Platform/AppendedFile.h"

namespace MarletFoundation {

Descriptor openToAppend(const std::string& path) {
  constexpr int flags = O_WRONLY | O_CREAT | O_APPEND | O_NONBLOCK | O_NOFOLLOW | O_NOCTTY | O_CLOEXEC;
  Descriptor file(retrying([&] { return ::open(path.c_str(), flags, 0600); }));
  struct stat status;
  if (!file || ::fstat(file.get(), &status) != 0) throwPosix(errno, path);
  if (!S_ISREG(status.st_mode)) throwNoRegularFile(status, path);
  return file;
}

}  // namespace MarletFoundation
