// Runs a fuzz target without libFuzzer: every file named on the command
// line, and every file in every directory named there (in name order), goes
// through LLVMFuzzerTestOneInput once. Paths after "--optional" may be
// missing (a target without crashers has no such directory). A finding
// aborts, as it does under the fuzzer; otherwise the exit status is 0 and
// one line counts the inputs. This is how the normal builds replay the
// committed corpus and crashers.
#include <stddef.h>
#include <stdint.h>
#include <stdio.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size);

namespace {

namespace fs = std::filesystem;

bool replay(const fs::path& path) {
    std::ifstream file(path, std::ios::binary);
    if (!file) {
        fprintf(stderr, "replay: cannot read %s\n", path.c_str());
        return false;
    }
    const std::vector<char> bytes((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    // A buffer of exactly the file's length, as libFuzzer gives, so that the
    // target reading one byte too many shows under AddressSanitizer.
    std::unique_ptr<uint8_t[]> input(new uint8_t[bytes.size()]);
    std::copy(bytes.begin(), bytes.end(), input.get());
    LLVMFuzzerTestOneInput(input.get(), bytes.size());
    return true;
}

}  // namespace

int main(int argc, char** argv) {
    size_t count = 0;
    bool optional = false;
    for (int i = 1; i < argc; ++i) {
        const fs::path path(argv[i]);
        if (path == "--optional") {
            optional = true;
            continue;
        }
        std::error_code error;
        if (optional && !fs::exists(path, error)) continue;
        if (!fs::is_directory(path, error)) {
            if (!replay(path)) return 1;
            ++count;
            continue;
        }
        std::vector<fs::path> files;
        for (const fs::directory_entry& entry : fs::directory_iterator(path)) {
            if (entry.is_regular_file()) files.push_back(entry.path());
        }
        std::sort(files.begin(), files.end());
        for (const fs::path& file : files) {
            if (!replay(file)) return 1;
            ++count;
        }
    }
    printf("replayed %zu inputs\n", count);
    return count > 0 ? 0 : 1;
}
