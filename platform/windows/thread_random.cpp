// SPDX-License-Identifier: MIT
//
// The compiler keeps a thread_local in memory that it allocates at the first use, so this word is put by hand into what the
// system's loader copies for each thread: sections named .tls$..., between the markers of the C runtime (.tls and .tls$ZZZ). Its
// address is that of the thread's copy for this module, found through the thread block at gs:[0x58] and the module's index, plus
// the word's place in the section.
#include "platform/thread_random.h"

extern "C" {
[[gnu::section(".tls$VXR"), gnu::used]] uint32_t vxcomnThreadRandomWord = 1;
}

namespace vxcomn {

[[gnu::section("RT_CODE")]] uint32_t *threadRandomWord() noexcept {
    uint32_t *address;
    uint64_t index;
    __asm__(
        "movl _tls_index(%%rip), %k1\n\t"
        "movq %%gs:0x58, %0\n\t"
        "movq (%0,%1,8), %0\n\t"
        "leaq vxcomnThreadRandomWord@SECREL32(%0), %0"
        : "=&r"(address), "=&r"(index));
    return address;
}

}  // namespace vxcomn
