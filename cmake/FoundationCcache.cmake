# Uses ccache where it is installed and nobody asked for another launcher.
find_program(FOUNDATION_CCACHE ccache)
if(FOUNDATION_CCACHE AND NOT DEFINED CMAKE_CXX_COMPILER_LAUNCHER)
    set(CMAKE_CXX_COMPILER_LAUNCHER "${FOUNDATION_CCACHE}")
endif()
