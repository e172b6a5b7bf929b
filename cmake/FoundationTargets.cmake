# The one place that says how targets of this project are compiled.

# Language level, visibility and warnings, for every target of ours.
function(foundation_configure_target target)
    target_compile_features(${target} PUBLIC cxx_std_20)
    set_target_properties(${target} PROPERTIES
        CXX_EXTENSIONS OFF
        CXX_VISIBILITY_PRESET hidden
        VISIBILITY_INLINES_HIDDEN ON
        POSITION_INDEPENDENT_CODE ON)
    if(FOUNDATION_STRICT)
        target_compile_options(${target} PRIVATE
            -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wsign-conversion -Wnon-virtual-dtor
            -Wold-style-cast -Wcast-qual -Wcast-align -Woverloaded-virtual -Wformat=2
            -Wimplicit-fallthrough -Wundef -Wunused -Wdouble-promotion -Wnull-dereference
            # g++ 12 sees an overlap in "text" + std::string at -O2 where there is none.
            $<$<CXX_COMPILER_ID:GNU>:-Wno-restrict>)
        set_target_properties(${target} PROPERTIES COMPILE_WARNING_AS_ERROR ON)
    endif()
endfunction()

# foundation_add_library(foundation_storage_local INCLUDE_ROOT <dir> SOURCES ... PUBLIC ... PRIVATE ...)
# makes the library and its alias foundation::storage_local; PUBLIC and PRIVATE name what it links.
function(foundation_add_library target)
    cmake_parse_arguments(arg "" "INCLUDE_ROOT" "SOURCES;PUBLIC;PRIVATE" ${ARGN})
    string(REGEX REPLACE "^foundation_" "" short_name ${target})
    add_library(${target} ${arg_SOURCES})
    add_library(foundation::${short_name} ALIAS ${target})
    foundation_configure_target(${target})
    target_include_directories(${target} PUBLIC
        "$<BUILD_INTERFACE:${arg_INCLUDE_ROOT}>"
        "$<INSTALL_INTERFACE:${FOUNDATION_INSTALL_INCLUDEDIR}>")
    target_link_libraries(${target} PUBLIC ${arg_PUBLIC} PRIVATE ${arg_PRIVATE})
    if(FOUNDATION_STRICT)
        target_link_options(${target} PRIVATE -Wl,--no-undefined)
    endif()
    set_target_properties(${target} PROPERTIES
        EXPORT_NAME ${short_name}
        FOUNDATION_INCLUDE_ROOT "${arg_INCLUDE_ROOT}"
        VERSION ${PROJECT_VERSION}
        SOVERSION ${PROJECT_VERSION_MAJOR}.${PROJECT_VERSION_MINOR})
    set_property(GLOBAL APPEND PROPERTY FOUNDATION_LIBRARIES ${target})
endfunction()

# foundation_select_tests(<variable> <file>...) lists the files to compile: the tests that hold FOUNDATION_TESTS_HOLDING
# or register tests named elsewhere (as the conformance kit does), and what helps them. Nothing when no test is left.
function(foundation_select_tests variable)
    set(selected)
    set(is_any FALSE)
    foreach(source IN LISTS ARGN)
        file(READ "${source}" text)
        set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS "${source}")
        if(text MATCHES "${FOUNDATION_TESTS_HOLDING}|FOUNDATION_STORAGE_[A-Z_]*CONFORMANCE|RegisterTest")
            list(APPEND selected "${source}")
            set(is_any TRUE)
        elseif(NOT source MATCHES "Test\\.cpp$" OR NOT text MATCHES "TEST")
            list(APPEND selected "${source}")
        endif()
    endforeach()
    if(NOT is_any)
        set(selected)
    endif()
    set(${variable} "${selected}" PARENT_SCOPE)
endfunction()

# foundation_add_tests(platform_tests SOURCES ... LINK ...) makes one GoogleTest program of a folder of tests.
function(foundation_add_tests target)
    cmake_parse_arguments(arg "" "" "SOURCES;LINK" ${ARGN})
    set(selected ${arg_SOURCES})
    if(FOUNDATION_TESTS_HOLDING)
        foundation_select_tests(selected ${arg_SOURCES})
    endif()
    if(NOT selected)
        # Named, so that the lines that follow in its folder hold, but not part of a build.
        add_executable(${target} EXCLUDE_FROM_ALL ${arg_SOURCES})
        return()
    endif()
    add_executable(${target} ${selected})
    foundation_configure_target(${target})
    target_compile_options(${target} PRIVATE ${FOUNDATION_TEST_OPTIONS})
    target_include_directories(${target} PRIVATE "${PROJECT_SOURCE_DIR}")
    target_link_libraries(${target} PRIVATE ${arg_LINK} GTest::gmock GTest::gtest_main)
    gtest_discover_tests(${target} DISCOVERY_TIMEOUT 60 PROPERTIES TIMEOUT 300)
endfunction()

set(FOUNDATION_INSTALL_INCLUDEDIR "${CMAKE_INSTALL_INCLUDEDIR}/foundation-storage")
