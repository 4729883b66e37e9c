// Feeds a target the files of the folder that is named on the command line.

#include "tests/fuzz/fuzz_target.h"

#include <filesystem>
#include <fstream>
#include <iterator>

int main(int count, char** words) {
  std::size_t files = 0;
  for (const auto& file : std::filesystem::directory_iterator(count > 1 ? words[1] : ".")) {
    std::ifstream stream(file.path(), std::ios::binary);
    const std::vector<std::uint8_t> bytes{std::istreambuf_iterator<char>(stream), {}};
    std::cerr << file.path().string() << std::endl;
    LLVMFuzzerTestOneInput(bytes.data(), bytes.size());
    ++files;
  }
  return files > 0 ? EXIT_SUCCESS : EXIT_FAILURE;
}
