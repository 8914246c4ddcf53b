// Checks on the built library file: exactly the intended dynamic symbols,
// levels that never reach each other's code, stub layout and tables, and
// an initialisation path that touches no vector or x87 register.
#include <dlfcn.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "zortest.h"

namespace {

std::string run(const std::string& command) {
    std::string out;
    FILE* pipe = popen(command.c_str(), "r");
    if (!pipe) return out;
    char buffer[4096];
    size_t n;
    while ((n = fread(buffer, 1, sizeof buffer, pipe)) > 0) out.append(buffer, n);
    pclose(pipe);
    return out;
}

std::vector<std::string> lines(const std::string& text) {
    std::vector<std::string> result;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) result.push_back(line);
    return result;
}

const std::string library = ZOR_LIBRARY_FILE;

std::vector<std::string> public_names() {
    std::vector<std::string> names;
    std::ifstream in(ZOR_NAMES_FILE);
    const std::regex entry(R"(^ZOR_API\((\w+)\))");
    std::smatch m;
    for (std::string line; std::getline(in, line);)
        if (std::regex_search(line, m, entry)) names.push_back(m[1]);
    return names;
}

// Every symbol of the library's full symbol table: name -> (address, type letter).
struct Symbol {
    uint64_t address;
    char type;
};
const std::map<std::string, Symbol>& symbols() {
    static std::map<std::string, Symbol> table = [] {
        std::map<std::string, Symbol> t;
        for (const std::string& line : lines(run("nm " + library))) {
            std::istringstream in(line);
            std::string address, type, name;
            if (in >> address >> type >> name) t[name] = {std::stoull(address, nullptr, 16), type[0]};
        }
        return t;
    }();
    return table;
}

const char* const services[] = {
    "zorInit", "zorSafeInit", "zorSetCpuFeatures", "zorJumpIndexForMergedLibs",
    "ownSetCpuFeaturesAndIdx", "ownFeaturesToIdx", "my_init",
    "zorGetCpuFeatures", "zorGetEnabledCpuFeatures", "zorSetCpuFeaturesMask", "ownSetFeatureMask",
    "ownGetFeature", "ownGetMaskFeatures", "ownMaskIsFeatures", "ownGetReg", "zor_get_cpuid",
    "zor_max_cpuid_input", "zor_has_cpuid", "zor_is_GenuineTarvo", "zorGetMaxCacheSizeB",
    "zor_get_cache_line_size", "zorGetNumCoresOnDie", "zor_get_cores_on_die", "zor_has_rdtsc",
    "zor_is_mmx_extension", "zor_is_ssx_extension", "zor_is_wni_extension",
    "zor_is_htt_extension", "zor_is_pni_extension", "zor_is_x8664_extension",
    "zor_is_mni_extension", "zor_is_sse41_extension", "zor_is_sse42_extension", "zor_is_movbe",
    "zor_is_avx_extension", "zor_is_avx512_extension", "zor_get_quindle_ident",
    "zorGetStatusString",
    "zorMalloc", "zorFree",
    "zorConstantOfNAN_64f", "zorConstantOfINF_64f", "zorConstantOfINF_NEG_64f",
    "zorConstantOfNAN_32f", "zorConstantOfINF_32f", "zorConstantOfINF_NEG_32f",
    "zorGetCpuClocks", "zor_get_quindle_counter", "zorStartTsc", "zorStopTsc", "zorStartTscp",
    "zorStopTscp", "ownGetNumThreads", "zorGetNumThreads", "zorSetNumThreads", "ps_get_cw_fpu",
    "ps_set_cw_fpu", "ps_get_sw_fpu", "ps_clear_fpu", "ps_get_ssx", "ps_set_ssx",
    "ps_destroy_ssx", "zor_set_cw_ssx", "zor_set_rc_ssx", "zor_clear_ssx", "zor_tst_daz_ssx",
    "zor_control87", "zor_status87", "zor_clear87", "zor_set_rcpc_fpu", "zor_set_cw_fpu",
    "zor_isnan", "zor_finite", "zorFpuSsx4TS",
};

TEST(Binary, ExportsExactlyTheIntendedNames) {
    std::set<std::string> expected(std::begin(services), std::end(services));
    for (const std::string& name : public_names()) {
        expected.insert(name);
        for (const zortest::Level& level : zortest::all_levels())
            expected.insert(std::string(level.name) + "_" + name);
    }
    std::set<std::string> exported;
    for (const std::string& line : lines(run("nm -D --defined-only " + library))) {
        std::istringstream in(line);
        std::string address, type, name;
        if (in >> address >> type >> name) exported.insert(name);
    }
    for (const std::string& name : exported)
        EXPECT_TRUE(expected.count(name)) << "unexpected export " << name;
    for (const std::string& name : expected)
        EXPECT_TRUE(exported.count(name)) << "missing export " << name;
}

TEST(Binary, HasSoname) {
    EXPECT_NE(run("readelf -d " + library).find("Library soname: [libzor.so.1]"), std::string::npos);
}

struct Range {
    uint64_t begin = 0, end = 0;
    bool contains(uint64_t a) const { return a >= begin && a < end; }
};

// Address ranges of each level's code and constants.
std::map<std::string, std::vector<Range>> level_ranges() {
    std::map<std::string, std::vector<Range>> ranges;
    const std::regex section(R"(\] \.zor_(text|rodata)_(\w+)\s+PROGBITS\s+([0-9a-f]+)\s+[0-9a-f]+\s+([0-9a-f]+))");
    std::smatch m;
    for (const std::string& line : lines(run("readelf -SW " + library)))
        if (std::regex_search(line, m, section)) {
            const uint64_t begin = std::stoull(m[3], nullptr, 16);
            ranges[m[2]].push_back({begin, begin + std::stoull(m[4], nullptr, 16)});
        }
    return ranges;
}

TEST(Binary, LevelsNeverReachEachOther) {
    const auto ranges = level_ranges();
    ASSERT_EQ(ranges.size(), zortest::all_levels().size());
    // Any address an instruction names: branch targets and rip-relative operands.
    const std::regex target(R"((?:call|jmp|j[a-z]+)\s+([0-9a-f]+) <|# ([0-9a-f]+) <)");
    // Nor through a public stub, which would jump to whatever level is selected.
    std::set<std::string> stubs;
    for (const std::string& name : public_names()) stubs.insert("<" + name + "@plt>");
    for (const auto& [level, own] : ranges) {
        const std::string code = run("objdump -d --no-show-raw-insn -j .zor_text_" + level + " " + library);
        size_t checked = 0;
        for (const std::string& line : lines(code)) {
            std::smatch m;
            const size_t open = line.find('<');
            if (open != std::string::npos)
                EXPECT_FALSE(stubs.count(line.substr(open, line.find('>', open) + 1 - open)))
                    << level << " calls a public stub: " << line;
            if (!std::regex_search(line, m, target)) continue;
            const uint64_t address = std::stoull(m[1].matched ? m[1] : m[2], nullptr, 16);
            ++checked;
            for (const auto& [other, theirs] : ranges) {
                if (other == level) continue;
                for (const Range& r : theirs)
                    EXPECT_FALSE(r.contains(address)) << level << " reaches " << other << ": " << line;
            }
        }
        EXPECT_GT(checked, 0u) << level;
    }
    // Inside a level's code only its own prefixed entries are global.
    for (const auto& [name, symbol] : symbols()) {
        for (const auto& [level, own] : ranges)
            for (const Range& r : own)
                if (r.contains(symbol.address) && isupper((unsigned char)symbol.type))
                    EXPECT_EQ(name.rfind(level + "_", 0), 0u) << name << " is global in " << level;
    }
}

TEST(Binary, StubsAndTables) {
    Dl_info info;
    ASSERT_NE(dladdr((void*)&zorInit, &info), 0);
    const uint64_t base = (uint64_t)info.dli_fbase;
    const auto& table = symbols();
    for (const std::string& name : public_names()) {
        ASSERT_TRUE(table.count(name) && table.count("in_" + name) && table.count("jmp_" + name)) << name;
        EXPECT_EQ(table.at(name).address % 32, 0u) << name;
        EXPECT_EQ(table.at("in_" + name).address % 32, 0u) << name;
        // Slot 0 is the initialising entry, then the levels in index order.
        void* const* slots = (void* const*)(base + table.at("jmp_" + name).address);
        EXPECT_EQ((uint64_t)slots[0], base + table.at("in_" + name).address) << name;
        for (const zortest::Level& level : zortest::all_levels()) {
            const std::string body = std::string(level.name) + "_" + name;
            EXPECT_EQ(slots[1 + level.index], dlsym(RTLD_DEFAULT, body.c_str())) << body;
        }
    }
    // Each stub: slot 1's address, the sign-extended index, the indirect jump.
    const std::string code = run("objdump -d --no-show-raw-insn -j .text " + library);
    const std::regex shape(
        R"(lea\s+0x[0-9a-f]+\(%rip\),%r11\s+# ([0-9a-f]+) .*\n.*mov\s+0x[0-9a-f]+\(%rip\),%r10\s+# [0-9a-f]+ <zorJumpIndexForMergedLibs.*\n.*movslq\s+\(%r10\),%r10\n.*jmp\s+\*\(%r11,%r10,8\))");
    for (const std::string& name : public_names()) {
        const size_t at = code.find("<" + name + ">:\n");
        ASSERT_NE(at, std::string::npos) << name;
        std::smatch m;
        const std::string body = code.substr(at, 400);
        ASSERT_TRUE(std::regex_search(body, m, shape)) << body;
        EXPECT_EQ(std::stoull(m[1], nullptr, 16), table.at("jmp_" + name).address + 8) << name;
    }
}

// Functions reachable from zorSafeInit, with their instructions.
TEST(Binary, InitialisationUsesGeneralRegistersOnly) {
    const std::string code = run("objdump -d --no-show-raw-insn -j .text " + library);
    std::map<std::string, std::vector<std::string>> functions;
    std::string current;
    const std::regex header(R"(^[0-9a-f]+ <([^>]+)>:$)");
    std::smatch m;
    for (const std::string& line : lines(code)) {
        if (std::regex_match(line, m, header)) current = m[1];
        else if (!current.empty() && line.find(":\t") != std::string::npos) functions[current].push_back(line);
    }
    const std::regex call(R"((?:call|jmp)\s+[0-9a-f]+ <([^>@+]+)(?:@plt)?(?:\+0x[0-9a-f]+)?>)");
    const std::regex forbidden(R"(%[xyz]mm|%st|%mm[0-7]|\tf[a-z]+ |vzero|ldmxcsr|stmxcsr|call\s+\*|jmp\s+\*)");
    std::set<std::string> seen{"zorSafeInit"};
    std::vector<std::string> work{"zorSafeInit"};
    while (!work.empty()) {
        const std::string name = work.back();
        work.pop_back();
        ASSERT_TRUE(functions.count(name)) << "no code for " << name;
        for (const std::string& line : functions[name]) {
            EXPECT_FALSE(std::regex_search(line, forbidden)) << name << ": " << line;
            if (std::regex_search(line, m, call) && !seen.count(m[1])) {
                seen.insert(m[1]);
                work.push_back(m[1]);
            }
        }
    }
    // The path reaches detection, selection and the vendor test, nothing else.
    for (const char* name : {"zorInit", "zorGetCpuFeatures", "zorSetCpuFeatures", "ownGetMaskFeatures",
                             "ownFeaturesToIdx", "zor_is_GenuineTarvo"})
        EXPECT_TRUE(seen.count(name)) << name;
    EXPECT_LT(seen.size(), 20u);
}

}  // namespace
