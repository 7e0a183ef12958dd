# How the test programs are made. Each is discovered by ctest test by test, so that tests run in parallel and a crash
# fails one of them.

include(GoogleTest)

# quillmere_test(name SOURCES file... LIBRARIES target... [TIMEOUT seconds])
function(quillmere_test name)
    cmake_parse_arguments(PARSE_ARGV 1 test "" "TIMEOUT" "SOURCES;LIBRARIES")
    if(NOT test_TIMEOUT)
        set(test_TIMEOUT 300) # for what hangs: no test is timed by this
    endif()
    add_executable(${name} ${test_SOURCES})
    quillmere_unite(${name})
    target_link_libraries(${name}
        PRIVATE ${test_LIBRARIES} GTest::gtest_main quillmere_compiler_options)
    quillmere_share_precompiled_headers(${name})
    quillmere_add_tests(${name} TIMEOUT ${test_TIMEOUT})
endfunction()

# quillmere_add_tests(program TIMEOUT seconds [PREFIX text])
#
# A process takes a sanitizer's runtime a tenth of a second to start and the counters of lines as much to write down, so
# the builds that have these run each program as a few tests, of which none is much longer than the others.
function(quillmere_add_tests program)
    cmake_parse_arguments(PARSE_ARGV 1 test "" "TIMEOUT;PREFIX" "")
    if(QUILLMERE_WHOLE_TEST_PROGRAMS)
        set(shards 4)
        foreach(shard RANGE 1 ${shards})
            math(EXPR index "${shard} - 1")
            add_test(NAME ${program}.${shard} COMMAND ${program} --gtest_brief=1)
            set_tests_properties(${program}.${shard} PROPERTIES
                TIMEOUT 1200 ENVIRONMENT "GTEST_TOTAL_SHARDS=${shards};GTEST_SHARD_INDEX=${index}")
        endforeach()
    else()
        # Cases go by their numbers: a printed value may hold an address, which differs from one build to the next.
        gtest_discover_tests(${program} TEST_PREFIX "${test_PREFIX}" NO_PRETTY_TYPES NO_PRETTY_VALUES
            DISCOVERY_TIMEOUT 60 PROPERTIES TIMEOUT ${test_TIMEOUT})
    endif()
endfunction()

# The first test program precompiles what most include; the others use that.
function(quillmere_share_precompiled_headers program)
    get_property(owner GLOBAL PROPERTY quillmere_precompiled_headers_owner)
    if(QUILLMERE_PRECOMPILED_HEADERS AND owner)
        target_precompile_headers(${program} REUSE_FROM ${owner})
        get_target_property(c_sources ${program} SOURCES)
        list(FILTER c_sources INCLUDE REGEX "\\.c$")
        # What is united does not keep the properties of its sources.
        set_source_files_properties(${c_sources} PROPERTIES
            SKIP_PRECOMPILE_HEADERS ON SKIP_UNITY_BUILD_INCLUSION ON)
        return()
    endif()
    set(headers gmock/gmock.h gtest/gtest.h)
    if(QUILLMERE_BUILD_TOOLS OR QUILLMERE_BUILD_EMULATOR)
        list(APPEND headers nlohmann/json.hpp)
    endif()
    quillmere_precompile(${program} ${headers})
    set_property(GLOBAL PROPERTY quillmere_precompiled_headers_owner ${program})
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
