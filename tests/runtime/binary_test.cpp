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
    if (FILE* pipe = popen(command.c_str(), "r")) {
        char buffer[4096];
        for (size_t n; (n = fread(buffer, 1, sizeof buffer, pipe)) > 0;) out.append(buffer, n);
        pclose(pipe);
    }
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
    for (std::string line; std::getline(in, line);)
        if (line.rfind("ZOR_API(", 0) == 0) names.push_back(line.substr(8, line.find(')') - 8));
    return names;
}

// name -> (address, type letter) from nm's listing.
struct Symbol {
    uint64_t address;
    char type;
};
std::map<std::string, Symbol> symbols(const std::string& options) {
    std::map<std::string, Symbol> table;
    for (const std::string& line : lines(run("nm " + options + " " + library))) {
        std::istringstream in(line);
        std::string address, type, name;
        if (in >> address >> type >> name) table[name] = {std::stoull(address, nullptr, 16), type[0]};
    }
    return table;
}

const char* const services[] = {
    "zorInit", "zorSafeInit", "zorSetCpuFeatures", "zorJumpIndexForMergedLibs", "my_init", "zorGetCpuFeatures",
    "zorGetEnabledCpuFeatures", "zorSetCpuFeaturesMask", "zor_get_cpuid", "zor_max_cpuid_input", "zor_has_cpuid",
    "zor_is_GenuineTarvo", "zorGetMaxCacheSizeB", "zor_get_cache_line_size", "zorGetNumCoresOnDie",
    "zor_get_cores_on_die", "zor_has_rdtsc", "zor_is_mmx_extension", "zor_is_ssx_extension",
    "zor_is_wni_extension", "zor_is_htt_extension", "zor_is_pni_extension", "zor_is_x8664_extension",
    "zor_is_mni_extension", "zor_is_sse41_extension", "zor_is_sse42_extension", "zor_is_movbe",
    "zor_is_avx_extension", "zor_is_avx512_extension", "zor_get_quindle_ident", "zorGetStatusString",
    "zorMalloc", "zorFree", "zorConstantOfNAN_64f", "zorConstantOfINF_64f", "zorConstantOfINF_NEG_64f",
    "zorConstantOfNAN_32f", "zorConstantOfINF_32f", "zorConstantOfINF_NEG_32f", "zorGetCpuClocks",
    "zor_get_quindle_counter", "zorStartTsc", "zorStopTsc", "zorStartTscp", "zorStopTscp", "zorGetNumThreads",
    "zorSetNumThreads", "ps_get_cw_fpu", "ps_set_cw_fpu", "ps_get_sw_fpu", "ps_clear_fpu", "ps_get_ssx",
    "ps_set_ssx", "ps_destroy_ssx", "zor_set_cw_ssx", "zor_set_rc_ssx", "zor_clear_ssx", "zor_tst_daz_ssx",
    "zor_control87", "zor_status87", "zor_clear87", "zor_set_rcpc_fpu", "zor_set_cw_fpu", "zor_isnan",
    "zor_finite", "zorFpuSsx4TS",
};

// The public names, each level's body of them and the services: the own*
// steps, in_ entries and tables stay inside.
TEST(Binary, ExportsExactlyTheIntendedNames) {
    std::set<std::string> expected(std::begin(services), std::end(services));
    for (const std::string& name : public_names()) {
        expected.insert(name);
        for (const zortest::Level& level : zortest::all_levels())
            expected.insert(std::string(level.name) + "_" + name);
    }
    const auto exported = symbols("-D --defined-only");
    for (const auto& [name, symbol] : exported) EXPECT_TRUE(expected.count(name)) << "unexpected export " << name;
    for (const std::string& name : expected) EXPECT_TRUE(exported.count(name)) << "missing export " << name;
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
    for (const auto& [name, symbol] : symbols(""))
        for (const auto& [level, own] : ranges)
            for (const Range& r : own)
                if (r.contains(symbol.address) && isupper((unsigned char)symbol.type))
                    EXPECT_EQ(name.rfind(level + "_", 0), 0u) << name << " is global in " << level;
}

TEST(Binary, StubsAndTables) {
    Dl_info info;
    ASSERT_NE(dladdr((void*)&zorInit, &info), 0);
    const uint64_t base = (uint64_t)info.dli_fbase;
    const auto table = symbols("");
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
    // How a stub reads its slot (slot 1 plus the sign-extended index) is
    // proven by use: the pre-initialisation probe lands on slot 0.
}

// Functions reachable from zorSafeInit, with their instructions.
TEST(Binary, InitialisationUsesGeneralRegistersOnly) {
#ifdef ZOR_SANITIZE
    GTEST_SKIP() << "sanitizer runtime calls on this path use vector registers";
#endif
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

// Instructions by the feature that allows them; a level may use a class
// only if its feature word has one of the bits. Patterns run on
// `objdump -d -w` lines: address, raw bytes, then the instruction.
const char* const kInsn = R"(^\s*[0-9a-f]+:\t[0-9a-f ]+\t)";
const char* const kEvex = R"(^\s*[0-9a-f]+:\t(?:(?:67|2e|3e|26|36|64|65) )*62 [0-9a-f ]+\t)";
struct IsaClass {
    const char* what;
    uint64_t allowed_by;
    const char* start;  // kInsn or kEvex
    const char* pattern;
};
const IsaClass isa_classes[] = {
    {"SSSE3", zorFeatureSSSE3, kInsn,
     R"((pshufb|palignr|pabs[bwd]|ph(add|sub)(w|d|sw)|pmaddubsw|pmulhrsw|psign[bwd])\s)"},
    {"SSE4.1", zorFeatureSSE41, kInsn,
     R"((pblendw|pblendvb|blendv?p[sd]|ptest|pmins[bd]|pmaxs[bd]|pminu[wd]|pmaxu[wd]|pmov[sz]x[bwd][wdq])"
     R"(|pextr[bdq]|pinsr[bdq]|extractps|insertps|round[ps][sd]|dpp[sd]|pcmpeqq|packusdw|pmulld|pmuldq)"
     R"(|mpsadbw|phminposuw|movntdqa)\s)"},
    // POPCNT has no bit of its own: it comes with SSE4.2 (y8 builds with it).
    {"SSE4.2, POPCNT", zorFeatureSSE42, kInsn, R"((pcmpgtq|crc32[bwlq]?|pcmp[ei]str[im]|popcnt)\s)"},
    {"MOVBE", zorFeatureMOVBE, kInsn, R"(movbe\s)"},
    // No level is built for LZCNT. (TZCNT is allowed: it is how GCC writes
    // rep bsf, which older processors run as bsf.)
    {"LZCNT", 0, kInsn, R"(lzcnt\s)"},
    {"VEX", zorFeatureAVX, kInsn, R"(v[a-z])"},
    {"AVX2, FMA, BMI", zorFeatureAVX2, kInsn,
     R"((vperm(d|q|pd|ps)|vperm2i128|vinserti128|vextracti128|vpbroadcast[bwdq]|vbroadcasti128)"
     R"(|vp?gather\w+|vpmaskmov[dq]|vps[lr]lv[dq]|vpsravd|vpblendd|vbroadcasts[sd]\s+%xmm)"
     R"(|vfn?m(add|sub)\w+|vfm(addsub|subadd)\w+|andn|bextr|blsi|blsmsk|blsr|bzhi|mulx|pdep|pext)"
     R"(|rorx|sarx|shlx|shrx)\s|vp(?!test|ermil|erm2f128)\w*\s.*%ymm)"},
    {"F16C", zorFeatureF16C | zorFeatureAVX512F, kInsn, R"(vcvt(ph2ps|ps2ph)\s)"},
    {"EVEX", zorFeatureAVX512F, kInsn, R"(.*(%zmm|%k[0-7]|\{%k|%[xy]mm(1[6-9]|2[0-9]|3[01])\b))"},
    {"EVEX", zorFeatureAVX512F, kEvex, ""},
    {"AVX-512BW", zorFeatureAVX512BW, kInsn,
     R"(k(mov|add|and|andn|or|xor|xnor|not|ortest|test|shiftl|shiftr)[dq]\s|kunpck(wd|dq)\s)"
     R"(|(vp(add|sub)(u?s)?[bw]|vpavg[bw]|vp(min|max)[su][bw]|vpabs[bw]|vpcmp(eq|gt)?u?[bw]|vptestn?m[bw])"
     R"(|vpblendm[bw]|vpbroadcast[bw]|vpmov[sz]xbw|vpmovu?s?wb|vpmov[bw]2m|vpmovm2[bw]|vps(ll|rl|ra)v?w)"
     R"(|vpmulh(u|rs)?w|vpmullw|vpunpck[lh](bw|wd)|vpshufb|vpshuf[lh]w|vpalignr|vpmaddwd|vpmaddubsw)"
     R"(|vpsadbw|vdbpsadbw|vpack[su]s(wb|dw)|vmovdqu(8|16)|vperm(i2|t2)?w|vps[lr]ldq)\s.*%zmm)"},
    {"AVX-512BW", zorFeatureAVX512BW, kEvex, R"(vp(extr|insr)[bw]\s)"},
    {"AVX-512DQ", zorFeatureAVX512DQ, kInsn,
     R"((vpmullq|vcvtt?p[sd]2u?qq|vcvtu?qq2p[sd]|vfpclass\w+|vrange\w+|vreduce\w+)"
     R"(|v(extract|insert)[fi](64x2|32x8)|vbroadcast[fi](32x8|64x2|32x2)|vpmov[dq]2m|vpmovm2[dq])"
     R"(|k(mov|add|and|andn|or|xor|xnor|not|ortest|test|shiftl|shiftr)b|kaddw|ktestw)\s)"
     R"(|v(and|andn|or|xor)p[sd]\s.*%zmm)"},
    {"AVX-512DQ", zorFeatureAVX512DQ, kEvex, R"(vp(extr|insr)[dq]\s)"},
    // EVEX on xmm/ymm alone is VL, unless the instruction is scalar.
    {"AVX-512VL", zorFeatureAVX512VL, kEvex,
     R"((?!v\w*(s[sd][lq]?|si)\s|vmov[dq]\s|vp(extr|insr))(?!.*%zmm).*%[xy]mm)"},
};

TEST(Binary, LevelsUseOnlyTheirInstructionSets) {
    for (const zortest::Level& level : zortest::all_levels()) {
        const std::string listing = ::testing::TempDir() + "zor_isa_" + level.name + ".txt";
        run("objdump -d -w -j .zor_text_" + std::string(level.name) + " " + library + " > " + listing);
        ASSERT_GT(std::stoul(run("wc -l < " + listing)), 1000u) << level.name;
        for (const IsaClass& c : isa_classes) {
            if (level.need & c.allowed_by) continue;
            const std::string found = run("grep -m5 -P '" + std::string(c.start) + "(?:" + c.pattern + ")' " + listing);
            EXPECT_EQ(found, "") << level.name << " uses " << c.what << ":\n" << found;
        }
        std::remove(listing.c_str());
    }
}

}  // namespace
