// The shared library must export exactly the documented names: a missing one
// breaks clients at load time, an extra one becomes an interface by accident.
#include <elf.h>
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <set>
#include <string>
#include <vector>

namespace {

const std::set<std::string> kDocumented = {
    // Logging and timing: AndroidLogMsg(int, ...), DefaultLogMsg(int, ...),
    // TimeStat's constructors (const char*, bool) and (const char*, const char*,
    // int, bool), destructor, operator()() and TimeStamp(const char*).
    "HX_LogMsg", "_Z13AndroidLogMsgiz", "_Z13DefaultLogMsgiz", "_ZN8TimeStatC1EPKcb", "_ZN8TimeStatC2EPKcb",
    "_ZN8TimeStatC1EPKcS1_ib", "_ZN8TimeStatC2EPKcS1_ib", "_ZN8TimeStatD1Ev", "_ZN8TimeStatD2Ev",
    "_ZN8TimeStatclEv", "_ZN8TimeStat9TimeStampEPKc",
    // Utilities: sort(int*, char**, int, int), swap(int*, int*, char*, char*).
    "_Z4sortPiPPcii", "_Z4swapPiS_PcS0_",
    // Images.
    "QKImage_requiredSize", "QKImage_size", "QKImage_createEmpty", "QKImage_createNew", "QKImage_createWrap",
    "QKImage_allocate", "QKImage_deallocate", "QKImage_reset", "QKImage_destroy", "QKImage_clone",
    "QKImage_cloneHeader", "QKImage_wrap",
    // Converters of the optional module.
    "QKConverter_create", "QKConverter_convert", "QKConverter_release",
    // Options.
    "QKOption_RegisterNew", "QKOption_FindByName", "QKOption_FindIdByName", "QKOption_FindById",
    "QKOption_FindNameById", "QKOption_CheckValueI", "QKOption_CheckValueF", "QKOption_CheckValueS",
    "QKOption_ParseStringI", "QKOption_ParseStringF",
    // Conversion, csc_run(const QKImage*, QKImage*), geometry.
    "QKImage_convert", "QKImage_copyAndConvert", "_Z7csc_runPK7QKImagePS_", "QKImage_rotate", "QKImage_scale",
    "QKImage_crop", "QKImage_drawImage",
    // Codecs and files, save_to_file(const char*, unsigned char*, unsigned int), fsize(FILE*).
    "QKImage_encodeToJpeg", "QKImage_decodeFromJpeg", "QKImage_saveToFile", "QKImage_loadFromFile",
    "_Z12save_to_filePKcPhj", "_Z5fsizeP8_IO_FILE",
};

// Names of the defined, globally visible entries of an ELF64 file's dynamic
// symbol table.
std::set<std::string> exported_names(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::vector<char> bytes((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    std::set<std::string> names;
    if (bytes.size() < sizeof(Elf64_Ehdr)) return names;
    const auto* header = reinterpret_cast<const Elf64_Ehdr*>(bytes.data());
    const auto* sections = reinterpret_cast<const Elf64_Shdr*>(bytes.data() + header->e_shoff);
    for (int i = 0; i < header->e_shnum; ++i) {
        if (sections[i].sh_type != SHT_DYNSYM) continue;
        const char* strings = bytes.data() + sections[sections[i].sh_link].sh_offset;
        const auto* symbols = reinterpret_cast<const Elf64_Sym*>(bytes.data() + sections[i].sh_offset);
        size_t count = sections[i].sh_size / sizeof(Elf64_Sym);
        for (size_t s = 1; s < count; ++s) {
            const Elf64_Sym& symbol = symbols[s];
            unsigned char binding = ELF64_ST_BIND(symbol.st_info);
            if (symbol.st_shndx == SHN_UNDEF || (binding != STB_GLOBAL && binding != STB_WEAK)) continue;
            if (ELF64_ST_VISIBILITY(symbol.st_other) == STV_HIDDEN) continue;
            names.insert(strings + symbol.st_name);
        }
    }
    return names;
}

TEST(Exports, ExactlyTheDocumentedSymbols) {
    std::set<std::string> exported = exported_names(QK_LIBRARY_FILE);
    ASSERT_FALSE(exported.empty()) << "no dynamic symbols read from " << QK_LIBRARY_FILE;
    for (const std::string& name : kDocumented) EXPECT_TRUE(exported.count(name)) << "missing: " << name;
    for (const std::string& name : exported) EXPECT_TRUE(kDocumented.count(name)) << "extra: " << name;
}

}  // namespace
