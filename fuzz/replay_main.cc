// Runs the fuzz target without libFuzzer, so it also builds with gcc and runs
// as an ordinary test: every file named on the command line (or found in a
// named folder) is replayed, and `--smoke N` adds N generated inputs —
// random wire-format messages and mutations of them — from a fixed seed.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace {

using Input = std::vector<std::uint8_t>;

class Random {
 public:
  explicit Random(std::uint64_t seed) : state_(seed) {}
  std::uint64_t next() {  // splitmix64
    std::uint64_t z = (state_ += 0x9E3779B97F4A7C15u);
    z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9u;
    z = (z ^ (z >> 27)) * 0x94D049BB133111EBu;
    return z ^ (z >> 31);
  }
  std::uint64_t below(std::uint64_t bound) { return next() % bound; }

 private:
  std::uint64_t state_;
};

void putVarint(Input& out, std::uint64_t value) {
  while (value >= 0x80) {
    out.push_back(static_cast<std::uint8_t>(value | 0x80));
    value >>= 7;
  }
  out.push_back(static_cast<std::uint8_t>(value));
}

// Field numbers the records use, metric IDs among them, and a few beyond.
std::uint64_t fieldNumber(Random& random) {
  static const std::uint64_t interesting[] = {19, 11788, 54541, 65537, 65555, 536870911};
  if (random.below(8) == 0) return interesting[random.below(std::size(interesting))];
  return 1 + random.below(36);
}

Input wireMessage(Random& random, int depth) {
  Input out;
  const auto fields = random.below(12);
  for (std::uint64_t i = 0; i < fields; ++i) {
    const auto wireType = random.below(depth > 3 ? 2 : 8);  // 6 and 7 are invalid on purpose
    putVarint(out, (fieldNumber(random) << 3) | wireType);
    switch (wireType) {
      case 0:
        putVarint(out, random.next() >> random.below(64));
        break;
      case 1:
        for (int b = 0; b < 8; ++b)
          out.push_back(static_cast<std::uint8_t>(random.next()));
        break;
      case 2: {
        const Input inner =
            random.below(2) == 0 ? wireMessage(random, depth + 1) : Input(random.below(6), 0x81);
        putVarint(out, inner.size());
        out.insert(out.end(), inner.begin(), inner.end());
        break;
      }
      case 5:
        for (int b = 0; b < 4; ++b)
          out.push_back(static_cast<std::uint8_t>(random.next()));
        break;
      default:
        break;
    }
  }
  return out;
}

Input mutated(Input input, Random& random) {
  const auto edits = 1 + random.below(4);
  for (std::uint64_t i = 0; i < edits && !input.empty(); ++i) {
    const auto at = static_cast<std::ptrdiff_t>(random.below(input.size()));
    switch (random.below(4)) {
      case 0:
        input[static_cast<std::size_t>(at)] ^= static_cast<std::uint8_t>(1u << random.below(8));
        break;
      case 1:
        input.resize(static_cast<std::size_t>(at));
        break;
      case 2:
        input.insert(input.begin() + at, static_cast<std::uint8_t>(random.next()));
        break;
      default:
        input.erase(input.begin() + at);
        break;
    }
  }
  return input;
}

void run(const Input& input) {
  LLVMFuzzerTestOneInput(input.data(), input.size());
}

void replay(const std::filesystem::path& path) {
  if (std::filesystem::is_directory(path)) {
    for (const auto& entry : std::filesystem::directory_iterator(path))
      replay(entry.path());
    return;
  }
  std::ifstream file(path, std::ios::binary);
  run(Input(std::istreambuf_iterator<char>(file), {}));
}

}  // namespace

int main(int argc, char* argv[]) {
  std::uint64_t smoke = 0;
  for (int i = 1; i < argc; ++i) {
    const std::string argument = argv[i];
    if (argument == "--smoke" && i + 1 < argc) {
      smoke = std::strtoull(argv[++i], nullptr, 10);
    } else {
      replay(argument);
    }
  }
  Random random(20261123);
  for (std::uint64_t i = 0; i < smoke; ++i) {
    const Input message = wireMessage(random, 0);
    run(message);
    run(mutated(message, random));
  }
  std::printf("replayed %llu generated inputs\n", 2ULL * smoke);
  return 0;
}
