// The shared library exports exactly the names its version script lists (a
// missing one breaks clients at load time, an extra one becomes an interface
// by accident), and the JPEG codec module exactly its two entry points.
#include <gtest/gtest.h>
#include <stdio.h>

#include <fstream>
#include <set>
#include <string>

namespace {

using Names = std::set<std::string>;

// Defined dynamic symbols, demangled (constructors and destructors of every
// kind give one name), without version nodes.
Names exported(const std::string& file) {
    Names names;
    FILE* nm = popen((QK_NM " -D --defined-only --demangle " + file).c_str(), "r");  // the toolchain's nm
    char type, name[512];
    while (nm != nullptr && fscanf(nm, "%*s %c %511[^\n]", &type, name) == 2) {
        if (type != 'A') names.insert(std::string(name).substr(0, std::string(name).find('@')));
    }
    EXPECT_EQ(nm != nullptr ? pclose(nm) : -1, 0);
    return names;
}

// The names of the script's global part, one a line: `name;` or `"name";`.
Names listed(const std::string& script) {
    std::ifstream in(script);
    Names names;
    bool global = false;
    for (std::string line; std::getline(in, line) && line.find("local:") == std::string::npos;) {
        global = global || line.find("global:") != std::string::npos;
        const size_t first = line.find_first_not_of(" \t\""), last = line.find_last_not_of(" \t\";");
        if (global && !line.empty() && line.back() == ';' && line.find('}') == std::string::npos) {
            names.insert(line.substr(first, last + 1 - first));
        }
    }
    return names;
}

TEST(Exports, ExactlyTheListedNames) {
    const Names names = listed(QK_EXPORTS_MAP);
    ASSERT_FALSE(names.empty()) << "no names read from " << QK_EXPORTS_MAP;
    EXPECT_EQ(exported(QK_LIBRARY_FILE), names);
    EXPECT_EQ(exported(QK_JPEG_MODULE_FILE), (Names{"fastJpegDecode", "fastJpegEncode"}));
}

}  // namespace
