# Gives quillmere::quillmere, the shared library, and quillmere::quillmere_static where the libraries are at hand that
# it needs. Who cannot do without the static one asks for the component "static".

include(CMakeFindDependencyMacro)
include(${CMAKE_CURRENT_LIST_DIR}/quillmere-shared-targets.cmake)
set(quillmere_shared_FOUND TRUE)

find_package(CURL 7.88 QUIET)
find_package(EXPAT 2.4 QUIET)
find_package(OpenSSL QUIET COMPONENTS Crypto)
find_package(Threads QUIET)
if(CURL_FOUND AND EXPAT_FOUND AND OpenSSL_FOUND AND Threads_FOUND)
    include(${CMAKE_CURRENT_LIST_DIR}/quillmere-static-targets.cmake)
    set(quillmere_static_FOUND TRUE)
endif()

foreach(component IN LISTS quillmere_FIND_COMPONENTS)
    if(quillmere_FIND_REQUIRED_${component} AND NOT quillmere_${component}_FOUND)
        set(quillmere_FOUND FALSE)
        set(quillmere_NOT_FOUND_MESSAGE "quillmere: component ${component} needs libcurl, expat and OpenSSL")
    endif()
endforeach()
