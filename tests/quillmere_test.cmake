# How the test programs are made. Each is discovered by ctest test by test, so that tests run in parallel and a crash
# fails one of them.

include(GoogleTest)

# quillmere_test(name SOURCES file... LIBRARIES target... [TIMEOUT seconds])
function(quillmere_test name)
    cmake_parse_arguments(PARSE_ARGV 1 test "" "TIMEOUT" "SOURCES;LIBRARIES")
    if(NOT test_TIMEOUT)
        set(test_TIMEOUT 120)
    endif()
    add_executable(${name} ${test_SOURCES})
    target_link_libraries(${name}
        PRIVATE ${test_LIBRARIES} GTest::gtest_main quillmere_compiler_options)
    quillmere_precompile(${name} gmock/gmock.h gtest/gtest.h)
    # Cases go by their numbers: a printed value may hold an address, which differs from one build to the next.
    gtest_discover_tests(${name} NO_PRETTY_TYPES NO_PRETTY_VALUES
        DISCOVERY_TIMEOUT 60 PROPERTIES TIMEOUT ${test_TIMEOUT})
endfunction()

# The same for a test of what the library does not export: it holds the library itself and sees its sources. The support
# library is linked as a file, because as a target it would bring the shared library along.
function(quillmere_internal_test name)
    cmake_parse_arguments(PARSE_ARGV 1 test "" "" "SOURCES;LIBRARIES")
    quillmere_test(${name}
        SOURCES ${test_SOURCES}
        LIBRARIES ${test_LIBRARIES} $<TARGET_FILE:quillmere_test_support> quillmere::quillmere_static
                  CURL::libcurl EXPAT::EXPAT OpenSSL::SSL OpenSSL::Crypto GTest::gmock Threads::Threads)
    add_dependencies(${name} quillmere_test_support)
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR}/tests ${PROJECT_SOURCE_DIR}/src)
endfunction()
