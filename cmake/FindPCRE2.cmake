# Finds PCRE2 for characters of 32 bits, which its own build with CMake alone describes to CMake: PCRE2::32BIT.
find_path(PCRE2_INCLUDE_DIR pcre2.h)
find_library(PCRE2_32BIT_LIBRARY pcre2-32)
mark_as_advanced(PCRE2_INCLUDE_DIR PCRE2_32BIT_LIBRARY)

include(FindPackageHandleStandardArgs)
find_package_handle_standard_args(PCRE2 REQUIRED_VARS PCRE2_32BIT_LIBRARY PCRE2_INCLUDE_DIR)

if(PCRE2_FOUND AND NOT TARGET PCRE2::32BIT)
    add_library(PCRE2::32BIT UNKNOWN IMPORTED)
    set_target_properties(PCRE2::32BIT PROPERTIES
        IMPORTED_LOCATION "${PCRE2_32BIT_LIBRARY}"
        INTERFACE_INCLUDE_DIRECTORIES "${PCRE2_INCLUDE_DIR}")
endif()
