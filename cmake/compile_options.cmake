# The options that every target of the tree is compiled with.
#
# Results are bit-identical on every compiler and instruction set, so nothing may fuse, reorder or approximate: no contraction into
# fused multiply-adds, no fast-math. g++ 12 reassociates sums of f32 in its straight-line vectoriser at -O3, so that pass is off.
add_compile_options(
    -Wall -Wextra -Wpedantic -Wshadow -Wpointer-arith -Werror
    $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor>
    $<$<COMPILE_LANGUAGE:CXX>:-Wno-invalid-offsetof>
    -ffp-contract=off -fno-tree-slp-vectorize)

if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    # The block path may call nothing outside its section, so no loop may turn into a call of memset or memcpy.
    add_compile_options(-fno-tree-loop-distribute-patterns)
    # Warnings that g++ 12 raises for its own library's strings and vectors, without cause.
    add_compile_options($<$<COMPILE_LANGUAGE:CXX>:-Wno-restrict> $<$<COMPILE_LANGUAGE:CXX>:-Wno-stringop-overflow>
                        $<$<COMPILE_LANGUAGE:CXX>:-Wno-array-bounds>)
endif()

if(WIN32)
    # UNICODE only tells the SDK headers which names to take. g++ does not align the stack to more than 16 bytes on this system, so
    # the assembler makes the spills of wide registers unaligned moves.
    add_compile_definitions(UNICODE _UNICODE WIN32_LEAN_AND_MEAN NOMINMAX _WIN32_WINNT=0x0A00)
    add_compile_options($<$<COMPILE_LANGUAGE:CXX>:-Wa,-muse-unaligned-vector-move>)
    add_link_options(-static)
endif()

if(VXCOMN_SANITIZE)
    add_compile_options(-fsanitize=${VXCOMN_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${VXCOMN_SANITIZE})
endif()

# One file for each instruction set: name_avx2.cpp, name_avx512.cpp. Everything else is plain x86-64, which is SSE2.
function(vxcomn_set_instruction_sets)
    foreach(source ${ARGN})
        if(source MATCHES "_avx2\\.cpp$")
            set_source_files_properties(${source} PROPERTIES COMPILE_OPTIONS "-mavx2")
        elseif(source MATCHES "_avx512\\.cpp$")
            # g++ 12 takes its own intrinsics' undefined lanes for uninitialised variables.
            set_source_files_properties(${source} PROPERTIES
                COMPILE_OPTIONS "-Wno-uninitialized;$<$<CXX_COMPILER_ID:GNU>:-Wno-maybe-uninitialized>;-mavx2;-mavx512f;-mavx512bw;-mavx512dq;-mavx512vl;-mprefer-vector-width=512")
        endif()
    endforeach()
endfunction()
