// CorpusReplayMain: the test build's stand-in for libFuzzer's main: runs the target on every file of its corpus (or of the paths given).
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size);

int main(int argc, char** argv) {
    namespace fs = std::filesystem;
    std::vector<fs::path> files;
    for (const fs::path& arg : argc > 1 ? std::vector<fs::path>(argv + 1, argv + argc)
                                       : std::vector<fs::path>{VANTOREL_FUZZ_CORPUS}) {
        if (!fs::is_directory(arg)) files.push_back(arg);
        else
            for (const auto& entry : fs::directory_iterator(arg)) files.push_back(entry.path());
    }
    std::sort(files.begin(), files.end());
    for (const fs::path& file : files) {
        std::ifstream in(file, std::ios::binary);
        const std::vector<char> read{std::istreambuf_iterator<char>(in), {}};
        // An exact-size copy: a read one past the end is a heap overflow that ASan reports.
        auto bytes = std::make_unique<uint8_t[]>(read.size());
        std::copy(read.begin(), read.end(), bytes.get());
        std::fprintf(stderr, "replaying %s\n", file.c_str());  // the input a crash is in
        LLVMFuzzerTestOneInput(bytes.get(), read.size());
    }
    std::printf("%zu inputs replayed\n", files.size());
    return files.empty() ? 1 : 0;
}
