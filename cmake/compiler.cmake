# How every target of this project is compiled: link quillmere_compiler_options privately.

add_library(quillmere_compiler_options INTERFACE)
target_compile_features(quillmere_compiler_options INTERFACE cxx_std_17)

set(warnings -Wall -Wextra -Wpedantic -Wconversion -Wformat=2)
# Where several sources are compiled as one, what is another's own is no shadow, and stays its own. One compiler can tell
# it from the shadows that a source throws by itself.
set(united "$<BOOL:$<TARGET_PROPERTY:UNITY_BUILD>>")
list(APPEND warnings "$<$<NOT:${united}>:-Wshadow>")
set(cxx_warnings -Wold-style-cast -Wmissing-declarations)
if(CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    list(APPEND cxx_warnings -Wmissing-prototypes)
elseif(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    list(APPEND cxx_warnings "$<${united}:-Wshadow=local;-Wno-subobject-linkage>")
endif()
target_compile_options(quillmere_compiler_options INTERFACE
    ${warnings} "$<$<COMPILE_LANGUAGE:CXX>:${cxx_warnings}>")
if(QUILLMERE_WARNINGS_AS_ERRORS)
    target_compile_options(quillmere_compiler_options INTERFACE -Werror)
endif()

# What ships does not tell where it was built, so that two builds of one commit are the same byte for byte. Builds for
# debugging keep the paths, by which debuggers and coverage find the sources.
target_compile_options(quillmere_compiler_options INTERFACE
    "$<$<NOT:$<CONFIG:Debug>>:-ffile-prefix-map=${PROJECT_SOURCE_DIR}/=;-ffile-prefix-map=${PROJECT_BINARY_DIR}=build>")
set(CMAKE_BUILD_RPATH_USE_ORIGIN ON)

if(QUILLMERE_SANITIZERS)
    set(sanitize -fsanitize=${QUILLMERE_SANITIZERS} -fno-omit-frame-pointer)
    if(QUILLMERE_SANITIZERS MATCHES "undefined")
        list(APPEND sanitize -fno-sanitize-recover=undefined)
    endif()
    # Compiled into everything, the test framework's templates included, or the runtimes disagree.
    add_compile_options(${sanitize})
    add_link_options(${sanitize})
endif()

if(QUILLMERE_COUNT_COVERAGE)
    # Counted by many threads at once, hence the atomic counters. The templates of others are left out: they would be most
    # of what each process writes down.
    add_compile_options(--coverage -fprofile-update=atomic -fprofile-exclude-files=/usr/include/.*)
    add_link_options(--coverage)
    add_compile_definitions(QUILLMERE_COUNT_COVERAGE)
endif()

# quillmere_precompile(target header...): large headers of other projects, which every source of a target would read
# anew. The sources include what they use all the same, since not every build does this.
function(quillmere_precompile target)
    if(QUILLMERE_PRECOMPILED_HEADERS)
        list(TRANSFORM ARGN PREPEND "$<$<COMPILE_LANGUAGE:CXX>:<")
        list(TRANSFORM ARGN APPEND "$<ANGLE-R>>")
        target_precompile_headers(${target} PRIVATE ${ARGN})
    endif()
endfunction()

# quillmere_unite(target): compiles its sources many at a time, which takes a fraction of the time where all of them use
# the same large templates. A source may then meet the local names of its neighbours.
function(quillmere_unite target)
    if(QUILLMERE_UNITED_SOURCES)
        set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_BATCH_SIZE 20)
    endif()
endfunction()
