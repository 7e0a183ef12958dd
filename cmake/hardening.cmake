# What every binary is hardened with. Distributors bring most of this along; it is here for those who build for
# themselves. scripts/check looks for it in what is installed.

include(CheckCXXCompilerFlag)

set(CMAKE_POSITION_INDEPENDENT_CODE ON)
add_compile_options(-fstack-protector-strong)
# There on some processors alone.
foreach(flag -fcf-protection -fstack-clash-protection)
    string(MAKE_C_IDENTIFIER "QUILLMERE_HAS${flag}" is_supported)
    check_cxx_compiler_flag(${flag} ${is_supported})
    if(${is_supported})
        add_compile_options(${flag})
    endif()
endforeach()
if(NOT QUILLMERE_SANITIZERS) # they check the same calls better
    # Without optimisation glibc checks nothing, and warns of that.
    add_compile_options("$<$<CONFIG:Release,RelWithDebInfo,MinSizeRel>:-U_FORTIFY_SOURCE;-D_FORTIFY_SOURCE=3>")
endif()
add_link_options(-Wl,-z,relro,-z,now,-z,noexecstack)

# Position-independent code is for the compiler; a program's linker has to be told as well.
function(quillmere_position_independent_program program)
    target_link_options(${program} PRIVATE -pie)
endfunction()
