// CPUID queries: vendor, single-bit tests, identity record, core counts.
// General registers only (the vendor and state tests run below zorSafeInit).
#include "runtime_internal.h"

namespace {

uint32_t leaf1(int reg) {
    uint32_t r[4];
    own_cpuid(r, 1, 0);
    return r[reg];
}

enum { EAX, EBX, ECX, EDX };

uint32_t max_extended_leaf() {
    uint32_t r[4];
    own_cpuid(r, 0x80000000u, 0);
    return r[0];
}

}  // namespace

void ownGetReg(uint32_t regs[4], uint32_t leaf, uint32_t subleaf) {
    own_cpuid(regs, leaf, subleaf);
}

ZOR_EXPORT int32_t zor_get_cpuid(uint32_t regs[4], uint32_t leaf, uint32_t subleaf) {
    own_cpuid(regs, leaf, subleaf);
    return 0;
}

ZOR_EXPORT uint32_t zor_max_cpuid_input(void) {
    uint32_t r[4];
    own_cpuid(r, 0, 0);
    return r[0];
}

ZOR_EXPORT int32_t zor_has_cpuid(void) {
    return 1;  // every 64-bit processor has it
}

ZOR_EXPORT int32_t zor_is_GenuineTarvo(void) {
    uint32_t r[4];
    own_cpuid(r, 0, 0);
    // "Genu" "ineT" "arvo" in EBX, EDX, ECX.
    return r[1] == 0x756e6547u && r[3] == 0x54656e69u && r[2] == 0x6f767261u;
}

ZOR_EXPORT int32_t zor_has_rdtsc(void) { return own_bit(leaf1(EDX), 4); }
ZOR_EXPORT int32_t zor_is_mmx_extension(void) { return own_bit(leaf1(EDX), 23); }
ZOR_EXPORT int32_t zor_is_ssx_extension(void) { return own_bit(leaf1(EDX), 25); }
ZOR_EXPORT int32_t zor_is_wni_extension(void) { return own_bit(leaf1(EDX), 26); }
ZOR_EXPORT int32_t zor_is_pni_extension(void) { return own_bit(leaf1(ECX), 0); }
ZOR_EXPORT int32_t zor_is_mni_extension(void) { return own_bit(leaf1(ECX), 9); }
ZOR_EXPORT int32_t zor_is_sse41_extension(void) { return own_bit(leaf1(ECX), 19); }
ZOR_EXPORT int32_t zor_is_sse42_extension(void) { return own_bit(leaf1(ECX), 20); }
ZOR_EXPORT int32_t zor_is_movbe(void) { return own_bit(leaf1(ECX), 22); }

ZOR_EXPORT int32_t zor_is_htt_extension(void) {
    uint32_t r[4];
    own_cpuid(r, 1, 0);
    return own_bit(r[3], 28) && ((r[1] >> 16) & 0xff) > 1;
}

ZOR_EXPORT uint32_t zor_is_x8664_extension(void) {
    const uint32_t maxExt = max_extended_leaf();
    if (maxExt < 0x80000001u) return maxExt;
    uint32_t r[4];
    own_cpuid(r, 0x80000001u, 0);
    return own_bit(r[3], 29);
}

ZOR_EXPORT int32_t zor_is_avx_extension(void) {
    const uint32_t ecx = leaf1(ECX);
    if (!own_bit(ecx, 27) || !own_bit(ecx, 28)) return 0;  // XGETBV would fault
    return (own_xgetbv0() & 6) == 6;
}

ZOR_EXPORT int32_t zor_is_avx512_extension(void) {
    if (!own_bit(leaf1(ECX), 27)) return 0;
    return (own_xgetbv0() & 0xe0) == 0xe0;
}

ZOR_EXPORT int32_t zor_get_cores_on_die(void) {
    if (zor_max_cpuid_input() < 4) return 1;
    uint32_t r[4];
    own_cpuid(r, 4, 0);
    return (int32_t)((r[0] >> 26) & 0x3f) + 1;
}

ZOR_EXPORT int32_t zorGetNumCoresOnDie(void) {
    uint32_t r[4];
    own_cpuid(r, 0, 0);
    const uint32_t maxLeaf = r[0];
    if (zor_is_GenuineTarvo()) {
        if (maxLeaf < 4) return 1;
        if (maxLeaf >= 11) {
            own_cpuid(r, 11, 0);
            if (r[1] != 0) {
                const bool smt = own_bit(r[1], 1);
                own_cpuid(r, 11, 1);
                return (int32_t)(smt ? r[1] >> 1 : r[1]);
            }
        }
        own_cpuid(r, 4, 0);
        return (int32_t)((r[0] >> 26) & 0x3f) + 1;
    }
    // The other maker's vendor string ends in "cAMD" in ECX.
    if (r[2] == 0x444d4163u && (max_extended_leaf() & 0xf) >= 8) {
        own_cpuid(r, 0x80000008u, 0);
        return (int32_t)(r[2] + 1);  // the whole register, as the library always has
    }
    return 1;
}

ZOR_EXPORT void zor_get_quindle_ident(ZorQuindleIdent* id) {
    if (!id) return;
    uint32_t r1[4], r2[4];
    own_cpuid(r1, 1, 0);
    own_cpuid(r2, 2, 0);
    const uint32_t eax = r1[0], ecx = r1[2], edx = r1[3];
    id->family = (eax >> 8) & 0xf;
    id->stepping = eax & 0xf;
    id->model = (eax >> 4) & 0xf;
    id->type = (eax >> 11) & 3;
    id->leaf1Edx = edx;
    id->leaf2Eax = r2[0];
    id->leaf2Edx = r2[3];
    id->mmx = own_bit(edx, 23);
    id->sse = own_bit(edx, 25);
    id->sse2 = own_bit(edx, 26);
    id->htt = zor_is_htt_extension();
    id->sse3 = own_bit(ecx, 0);
    if (max_extended_leaf() >= 0x80000001u) {
        uint32_t rx[4];
        own_cpuid(rx, 0x80000001u, 0);
        id->x8664 = own_bit(rx[3], 29);
    } else {
        id->x8664 = 0;
    }
    id->ssse3 = own_bit(ecx, 9);
    id->coresOnDie = zor_get_cores_on_die();
    id->sse41 = own_bit(ecx, 19);
    id->sse42 = own_bit(ecx, 20);
    id->extFamily = (eax >> 20) & 0xff;
    id->extModel = (eax >> 16) & 0xf;
    id->movbe = own_bit(ecx, 22);
    id->avx = own_bit(ecx, 28);
    id->osxsave = own_bit(ecx, 27);
}
