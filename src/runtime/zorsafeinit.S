/* void zorSafeInit(void);
 *
 * Runs zorInit in the middle of an interrupted call (from an in_ entry):
 * keeps the integer argument registers and RAX (vector count of variadic
 * calls). Vector and x87 state is not saved; the code below zorInit is
 * built for general registers only and never touches it. */

    .text
    .globl  zorSafeInit
    .type   zorSafeInit, @function
    .p2align 5
zorSafeInit:
    /* Entered with RSP = 0 mod 16 (in_ was reached by a call, then called
     * us). Seven pushes and 8 more bytes realign it for the call. */
    pushq   %rdi
    pushq   %rsi
    pushq   %rdx
    pushq   %rcx
    pushq   %r8
    pushq   %r9
    pushq   %rax
    subq    $8, %rsp
    call    zorInit@PLT
    addq    $8, %rsp
    popq    %rax
    popq    %r9
    popq    %r8
    popq    %rcx
    popq    %rdx
    popq    %rsi
    popq    %rdi
    ret
    .size   zorSafeInit, .-zorSafeInit

    .section .note.GNU-stack, "", @progbits
