# ic_harden(target): what makes a fault in a delivered library harder to exploit. It concerns the library alone, not
# what links it. tests/package/hardening.sh shows that each of these is there.
include(CheckCXXCompilerFlag)
check_cxx_compiler_flag(-fstack-clash-protection IC_HAS_STACK_CLASH_PROTECTION)
check_cxx_compiler_flag(-fcf-protection IC_HAS_CONTROL_FLOW_PROTECTION)

function(ic_harden target)
    target_compile_options(${target} PRIVATE
        -fstack-protector-strong
        $<$<BOOL:${IC_HAS_STACK_CLASH_PROTECTION}>:-fstack-clash-protection>
        $<$<BOOL:${IC_HAS_CONTROL_FLOW_PROTECTION}>:-fcf-protection>)
    target_link_options(${target} PRIVATE LINKER:-z,relro LINKER:-z,now LINKER:-z,noexecstack)
    # A sanitizer checks buffers itself, and its run-time library is not linked to the library. It may come with the
    # flags, or with the options of a project that includes this one.
    get_directory_property(inherited COMPILE_OPTIONS)
    if(NOT "${CMAKE_CXX_FLAGS};${inherited}" MATCHES "-fsanitize")
        # Some compilers define it themselves; without optimisation it would only warn.
        set(optimised $<CONFIG:Release,RelWithDebInfo,MinSizeRel>)
        target_compile_options(${target} PRIVATE
            $<${optimised}:-U_FORTIFY_SOURCE> $<${optimised}:-D_FORTIFY_SOURCE=2>)
        target_link_options(${target} PRIVATE LINKER:-z,defs)
    endif()
endfunction()
