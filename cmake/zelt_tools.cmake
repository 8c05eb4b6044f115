# Programs that a build uses. Debian's own Python has the packages; another one on the PATH may not.

find_program(ZELT_PYTHON python3 PATHS /usr/bin NO_DEFAULT_PATH)
find_program(ZELT_PYTHON python3)
find_program(ZELT_CCACHE ccache)
if(ZELT_CCACHE AND PROJECT_IS_TOP_LEVEL AND NOT CMAKE_CXX_COMPILER_LAUNCHER)
    set(CMAKE_CXX_COMPILER_LAUNCHER ${ZELT_CCACHE})
endif()
