/* Public entry points of every dispatched operation, generated from
 * jmp_names.def. For each name:
 *
 *   <name>      public stub: jumps through slot 1 + zorJumpIndexForMergedLibs
 *               of its table, so index -1 (not yet selected) lands on slot 0.
 *               Arguments and return address go through untouched.
 *   in_<name>   slot 0: zorSafeInit, then the public name again through the
 *               dynamic symbol (interposable), now reaching a level.
 *   jmp_<name>  eight slots: in_<name>, then the level bodies in index order.
 *
 * Stub and entry are each padded to 32 bytes. */

#include "zor_levels.h"

#define ZOR_API(name)                                              \
    .text;                                                          \
    .globl name;                                                    \
    .type name, @function;                                          \
    .p2align 5;                                                     \
name:                                                               \
    leaq    jmp_##name+8(%rip), %r11;                               \
    movq    zorJumpIndexForMergedLibs@GOTPCREL(%rip), %r10;         \
    movslq  (%r10), %r10;                                           \
    jmpq    *(%r11,%r10,8);                                         \
    .size name, .-name;                                             \
    .type in_##name, @function;                                     \
    .p2align 5;                                                     \
in_##name:                                                          \
    call    zorSafeInit@PLT;                                        \
    jmp     name@PLT;                                               \
    .size in_##name, .-in_##name;                                   \
    .data;                                                          \
    .p2align 6;                                                     \
    .type jmp_##name, @object;                                      \
jmp_##name:                                                         \
    .quad   in_##name;                                              \
    ZOR_LEVEL_SLOTS(name)                                           \
    .size jmp_##name, .-jmp_##name;

#include "jmp_names.def"

    .section .note.GNU-stack, "", @progbits
