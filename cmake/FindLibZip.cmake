# Finds libzip, as LibZip::LibZip. (The CMake files in libzip's own package ask for its programs, too.)
include(FindPackageHandleStandardArgs)

find_path(LibZip_INCLUDE_DIR zip.h)
find_library(LibZip_LIBRARY zip)
if(LibZip_INCLUDE_DIR AND EXISTS "${LibZip_INCLUDE_DIR}/zipconf.h")
    file(STRINGS "${LibZip_INCLUDE_DIR}/zipconf.h" LibZip_VERSION REGEX "define LIBZIP_VERSION ")
    string(REGEX REPLACE "[^0-9.]" "" LibZip_VERSION "${LibZip_VERSION}")
endif()
find_package_handle_standard_args(LibZip
    REQUIRED_VARS LibZip_LIBRARY LibZip_INCLUDE_DIR VERSION_VAR LibZip_VERSION)
mark_as_advanced(LibZip_LIBRARY LibZip_INCLUDE_DIR)

if(LibZip_FOUND AND NOT TARGET LibZip::LibZip)
    add_library(LibZip::LibZip UNKNOWN IMPORTED)
    set_target_properties(LibZip::LibZip PROPERTIES
        IMPORTED_LOCATION "${LibZip_LIBRARY}"
        INTERFACE_INCLUDE_DIRECTORIES "${LibZip_INCLUDE_DIR}")
endif()
