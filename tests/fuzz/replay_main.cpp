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

int main(int argc, char** argv) {
    namespace fs = std::filesystem;
    size_t count = 0;
    bool optional = false;
    for (int i = 1; i < argc; ++i) {
        const fs::path path(argv[i]);
        std::error_code error;
        if (path == "--optional") optional = true;
        if (path == "--optional" || (optional && !fs::exists(path, error))) continue;
        std::vector<fs::path> files{path};
        if (fs::is_directory(path, error)) files.assign(fs::directory_iterator(path), fs::directory_iterator());
        std::sort(files.begin(), files.end());
        for (const fs::path& file : files) {
            std::ifstream in(file, std::ios::binary);
            const std::vector<char> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
            if (!in && !in.eof()) return fprintf(stderr, "replay: cannot read %s\n", file.c_str()), 1;
            // A buffer of exactly the file's length, as libFuzzer gives, so
            // that the target reading one byte too many shows under
            // AddressSanitizer.
            const std::unique_ptr<uint8_t[]> input(new uint8_t[bytes.size()]);
            std::copy(bytes.begin(), bytes.end(), input.get());
            LLVMFuzzerTestOneInput(input.get(), bytes.size());
            ++count;
        }
    }
    printf("replayed %zu inputs\n", count);
    return count > 0 ? 0 : 1;
}
