#pragma once

/// Compiles a function twice, for every machine and for the wider vectors of newer ones; which of them runs is decided when
/// the library is loaded. Only for functions of an unnamed namespace: of any other, the compiler exports what decides. Both
/// give the same bits: the wider one has no fused multiply-add, and sources that use this are compiled without contracting
/// expressions. Sanitizers cannot be asked so early, and clang does not do this to templates: their builds have the plain
/// one alone.
#if defined(__x86_64__) && defined(__ELF__) && !defined(__clang__) && !defined(__SANITIZE_ADDRESS__) && \
    !defined(__SANITIZE_THREAD__)
#    define VELDRIN_VECTOR_CLONES __attribute__((target_clones("avx2", "default")))
#else
#    define VELDRIN_VECTOR_CLONES
#endif
