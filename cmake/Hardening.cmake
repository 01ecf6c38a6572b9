# ic_harden(target): compiles and links a delivered library so that a fault in it is harder to exploit. Nothing of this
# reaches the targets that link it. tests/package/hardening.sh checks each option.
include(CheckCXXCompilerFlag)
check_cxx_compiler_flag(-fstack-clash-protection IC_HAS_STACK_CLASH_PROTECTION)
check_cxx_compiler_flag(-fcf-protection IC_HAS_CONTROL_FLOW_PROTECTION)

function(ic_harden target)
    target_compile_options(${target} PRIVATE
        -fstack-protector-strong
        $<$<BOOL:${IC_HAS_STACK_CLASH_PROTECTION}>:-fstack-clash-protection>
        $<$<BOOL:${IC_HAS_CONTROL_FLOW_PROTECTION}>:-fcf-protection>)
    target_link_options(${target} PRIVATE LINKER:-z,relro LINKER:-z,now LINKER:-z,noexecstack)
    # Sanitizers check buffers themselves, and their run-time library is linked to the program alone (no -z defs). They
    # come with the flags, or with the options of a project that includes this one.
    get_directory_property(inherited COMPILE_OPTIONS)
    if(NOT "${CMAKE_CXX_FLAGS};${inherited}" MATCHES "-fsanitize")
        # Some compilers predefine it. Without optimisation it has no effect but a warning.
        set(optimised $<CONFIG:Release,RelWithDebInfo,MinSizeRel>)
        target_compile_options(${target} PRIVATE
            $<${optimised}:-U_FORTIFY_SOURCE> $<${optimised}:-D_FORTIFY_SOURCE=2>)
        target_link_options(${target} PRIVATE LINKER:-z,defs)
    endif()
endfunction()
