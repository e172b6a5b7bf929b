# cmake --install and find_package(foundation_storage): every library made by foundation_add_library, its headers, and the
# command line tool with its manual page and what lets shells complete its commands.
include(CMakePackageConfigHelpers)

set(package_dir "${CMAKE_INSTALL_LIBDIR}/cmake/foundation_storage")
get_property(libraries GLOBAL PROPERTY FOUNDATION_LIBRARIES)

# Installed programs and libraries find the libraries beside them, wherever the prefix is moved to.
function(foundation_set_rpath target install_dir)
    file(RELATIVE_PATH to_libraries "/prefix/${install_dir}" "/prefix/${CMAKE_INSTALL_LIBDIR}")
    set_target_properties(${target} PROPERTIES INSTALL_RPATH "$ORIGIN/${to_libraries}")
endfunction()

# The headers of a library are those of its folder, and the one beside the folder that bears its name.
function(foundation_install_headers target)
    get_target_property(folder ${target} SOURCE_DIR)
    get_target_property(include_root ${target} FOUNDATION_INCLUDE_ROOT)
    cmake_path(RELATIVE_PATH folder BASE_DIRECTORY "${include_root}" OUTPUT_VARIABLE include_path)
    set(destination "${FOUNDATION_INSTALL_INCLUDEDIR}/${include_path}")
    install(DIRECTORY "${folder}/" DESTINATION "${destination}" FILES_MATCHING PATTERN "*.hpp")
    if(EXISTS "${folder}.hpp")
        install(FILES "${folder}.hpp" DESTINATION "${destination}/..")
    endif()
endfunction()

foreach(library IN LISTS libraries)
    foundation_set_rpath(${library} "${CMAKE_INSTALL_LIBDIR}")
    foundation_install_headers(${library})
endforeach()

# foundation_install_set(foundation_storage lib...) installs libraries that a user finds together.
function(foundation_install_set set)
    install(TARGETS ${ARGN} EXPORT ${set})
    install(EXPORT ${set} FILE ${set}-targets.cmake NAMESPACE foundation:: DESTINATION "${package_dir}")
endfunction()

# The kit for authors of providers needs GoogleTest, which other users need not have.
if(TARGET foundation_storage_conformance)
    list(REMOVE_ITEM libraries foundation_storage_conformance)
    foundation_install_set(foundation_storage_conformance foundation_storage_conformance)
endif()
foundation_install_set(foundation_storage ${libraries})

configure_package_config_file(
    "${CMAKE_CURRENT_LIST_DIR}/foundation_storage-config.cmake.in"
    "${PROJECT_BINARY_DIR}/foundation_storage-config.cmake"
    INSTALL_DESTINATION "${package_dir}"
    NO_SET_AND_CHECK_MACRO)
write_basic_package_version_file(
    "${PROJECT_BINARY_DIR}/foundation_storage-config-version.cmake"
    COMPATIBILITY SameMinorVersion)
install(FILES
    "${PROJECT_BINARY_DIR}/foundation_storage-config.cmake"
    "${PROJECT_BINARY_DIR}/foundation_storage-config-version.cmake"
    "${CMAKE_CURRENT_LIST_DIR}/FindLibZip.cmake"
    "${CMAKE_CURRENT_LIST_DIR}/FindPCRE2.cmake"
    DESTINATION "${package_dir}")

if(TARGET storage_tool)
    foundation_set_rpath(storage_tool "${CMAKE_INSTALL_BINDIR}")
    install(TARGETS storage_tool)
    if(TARGET storage_tool_share)
        get_target_property(tool_dir storage_tool BINARY_DIR)
        install(DIRECTORY "${tool_dir}/share/" DESTINATION "${CMAKE_INSTALL_DATAROOTDIR}")
    endif()
endif()
install(FILES "${PROJECT_SOURCE_DIR}/LICENSE" DESTINATION "${CMAKE_INSTALL_DATAROOTDIR}/doc/foundation-storage")
