// Runs a fuzzer's inputs once each where libFuzzer is not available (g++):
// every file argument and every file in a folder argument; options ('-...')
// are ignored, so the command line is that of a libFuzzer binary with -runs=0.
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

int main(int argc, char** argv)
{
    namespace fs = std::filesystem;
    std::set<fs::path> inputs;
    for (int i = 1; i < argc; ++i)
        if (argv[i][0] != '-')
            fs::is_directory(argv[i]) ? inputs.insert(fs::directory_iterator(argv[i]), fs::directory_iterator())
                                      : void(inputs.insert(argv[i]));
    for (const fs::path& input : inputs) {
        std::ifstream in(input, std::ios::binary);
        if (!in && std::fprintf(stderr, "cannot read %s\n", input.c_str()))
            return 2;
        const std::string bytes = (std::ostringstream() << in.rdbuf()).str();
        LLVMFuzzerTestOneInput(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
    }
    std::fprintf(stderr, "replayed %zu inputs\n", inputs.size());
    return inputs.empty() ? 1 : 0;
}
