# How every target of this project is compiled: link quillmere_compiler_options privately.

add_library(quillmere_compiler_options INTERFACE)
target_compile_features(quillmere_compiler_options INTERFACE cxx_std_17)

set(warnings -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wformat=2)
set(cxx_warnings -Wold-style-cast -Wmissing-declarations)
if(CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    list(APPEND cxx_warnings -Wmissing-prototypes)
endif()
target_compile_options(quillmere_compiler_options INTERFACE
    ${warnings} "$<$<COMPILE_LANGUAGE:CXX>:${cxx_warnings}>")
if(QUILLMERE_WARNINGS_AS_ERRORS)
    target_compile_options(quillmere_compiler_options INTERFACE -Werror)
endif()

if(QUILLMERE_SANITIZERS)
    set(sanitize -fsanitize=${QUILLMERE_SANITIZERS} -fno-omit-frame-pointer)
    if(QUILLMERE_SANITIZERS MATCHES "undefined")
        list(APPEND sanitize -fno-sanitize-recover=undefined)
    endif()
    # Compiled into everything, the test framework's templates included, or the runtimes disagree.
    add_compile_options(${sanitize})
    add_link_options(${sanitize})
endif()
