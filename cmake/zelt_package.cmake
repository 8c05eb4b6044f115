# Debian packages: ./dev package. What each holds is told by the components of the install rules; what it needs of the
# system is read from its binaries.

set(ZELT_PACKAGE_CONTACT "the zelt authors <zelt@zelt.example>" CACHE STRING "Whom the packages name as maintainer")

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME zelt)
set(CPACK_PACKAGE_CONTACT "${ZELT_PACKAGE_CONTACT}")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_LIBRARY_OUTPUT_DIRECTORY})
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)
set(CPACK_COMPONENTS_ALL "")

configure_file(${PROJECT_SOURCE_DIR}/cmake/package/changelog.in ${PROJECT_BINARY_DIR}/package/changelog @ONLY)
configure_file(${PROJECT_SOURCE_DIR}/cmake/package/copyright.in ${PROJECT_BINARY_DIR}/package/copyright @ONLY)
find_program(ZELT_GZIP gzip REQUIRED)
execute_process(COMMAND ${ZELT_GZIP} -9nkf changelog WORKING_DIRECTORY ${PROJECT_BINARY_DIR}/package
    COMMAND_ERROR_IS_FATAL ANY)

# zelt_package(COMPONENT PACKAGE SECTION "needs other components" "summary" "more")
macro(zelt_package component package section needs summary more)
    string(TOUPPER ${component} key)
    list(APPEND CPACK_COMPONENTS_ALL ${component})
    set(CPACK_DEBIAN_${key}_PACKAGE_NAME ${package})
    set(CPACK_DEBIAN_${key}_PACKAGE_SECTION ${section})
    set(CPACK_DEBIAN_${key}_DESCRIPTION "${summary}\n${more}")
    set(CPACK_COMPONENT_${key}_DEPENDS ${needs})
    install(FILES ${PROJECT_BINARY_DIR}/package/copyright DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/${package}
        COMPONENT ${component} EXCLUDE_FROM_ALL)
    install(FILES ${PROJECT_BINARY_DIR}/package/changelog.gz RENAME changelog.Debian.gz
        DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/${package} COMPONENT ${component} EXCLUDE_FROM_ALL)
endmacro()

set(about "Dark and gain correction of camera frames, arithmetic, filters and
measurements on twenty pixel types of any strides, with the same bits on
every processor.")

zelt_package(library libzelt${PROJECT_VERSION_MAJOR} libs "" "image processing for instruments, library"
    "${about}")
zelt_package(development libzelt-dev libdevel library "image processing for instruments, development files"
    "${about}\n.\nHeaders, and what find_package and pkg-config look for.")
zelt_package(codecs libzelt-codecs libs library "image processing for instruments, TIFF and PNG files"
    "${about}\n.\nReads and writes image files for the command line and the Python package.")
zelt_package(command_line zelt science "library;codecs" "image processing for instruments, command line"
    "${about}\n.\nThe program zelt corrects camera frames, measures images and calls every\nmethod of the library.")
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS_POLICY ">=")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_CONTROL_EXTRA ${PROJECT_SOURCE_DIR}/cmake/package/triggers)

if(ZELT_PYTHON_PACKAGE)
    zelt_package(python python3-zelt python "library;codecs" "image processing for instruments, Python package"
        "${about}\n.\nWorks on NumPy arrays without copying; zelt.dask spreads stacks of frames\nover processes.")
    find_package(Python QUIET COMPONENTS Interpreter)
    math(EXPR next_minor "${Python_VERSION_MINOR} + 1")
    set(CPACK_DEBIAN_PYTHON_PACKAGE_DEPENDS "python3 (>= ${Python_VERSION_MAJOR}.${Python_VERSION_MINOR}), \
python3 (<< ${Python_VERSION_MAJOR}.${next_minor}), python3-numpy")
    set(CPACK_DEBIAN_PYTHON_PACKAGE_SUGGESTS "python3-dask, python3-distributed")
    set(CPACK_DEBIAN_PYTHON_PACKAGE_CONTROL_EXTRA
        ${PROJECT_SOURCE_DIR}/cmake/package/postinst ${PROJECT_SOURCE_DIR}/cmake/package/prerm)
endif()

include(CPack)
