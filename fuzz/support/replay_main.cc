// Runs a fuzz harness over stored inputs: the corpus as an ordinary test, without a fuzzer.
#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace {

void Replay(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios_base::binary);
  const std::string input((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
  std::cout << path.string() << " (" << input.size() << " bytes)" << std::endl;
  LLVMFuzzerTestOneInput(reinterpret_cast<const std::uint8_t*>(input.data()), input.size());
}

}  // namespace

// Takes folders of inputs. Fails when there is none, since then nothing would be tested.
int main(int count, char** arguments) {
  std::size_t replayed = 0;
  for (int index = 1; index < count; ++index) {
    for (const auto& entry : std::filesystem::directory_iterator(arguments[index])) {
      Replay(entry.path());
      ++replayed;
    }
  }
  return replayed > 0 ? 0 : 1;
}
