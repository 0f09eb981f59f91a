// Gives a fuzz target the inputs that lie in a directory, so that the ordinary tests run what fuzzing found once:
// `replay_seeds TARGET DIRECTORY`. An input that a target objects to ends the process.

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <string_view>

#define TARGET(name) extern "C" int name(const std::uint8_t* bytes, std::size_t size);
#include "FuzzTargets.inc"
#undef TARGET

int main(int, char** argv) {
  using Target = int (*)(const std::uint8_t*, std::size_t);
  Target target = nullptr;
#define TARGET(name) \
  if (std::string_view(argv[1]) == #name) target = name;
#include "FuzzTargets.inc"
#undef TARGET

  int count = 0;
  for (const auto& entry : std::filesystem::directory_iterator(argv[2])) {
    std::ifstream file(entry.path(), std::ios::binary);
    const std::string input(std::istreambuf_iterator<char>(file), {});
    std::cout << entry.path().filename() << std::endl;
    target(reinterpret_cast<const std::uint8_t*>(input.data()), input.size());
    ++count;
  }
  return count > 0 ? 0 : 1;
}
