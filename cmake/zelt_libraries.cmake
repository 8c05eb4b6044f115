# The two libraries made of all rooms: `zelt`, which clients link, and `zelt_internal`, the same objects
# as an archive for the tests, benchmarks and fuzz targets that reach behind the exported names.

set(THREADS_PREFER_PTHREAD_FLAG ON)
find_package(Threads REQUIRED)

file(GLOB rooms CONFIGURE_DEPENDS LIST_DIRECTORIES true RELATIVE ${PROJECT_SOURCE_DIR}/src ${PROJECT_SOURCE_DIR}/src/*)
foreach(room ${rooms})
    if(IS_DIRECTORY ${PROJECT_SOURCE_DIR}/src/${room})
        zelt_room(${room})
    endif()
endforeach()

get_property(object_libraries GLOBAL PROPERTY zelt_object_libraries)
get_property(system_libraries GLOBAL PROPERTY zelt_system_libraries)
if(NOT object_libraries)
    message(FATAL_ERROR "zelt: no sources found below ${PROJECT_SOURCE_DIR}/src")
endif()
set(objects "")
foreach(library ${object_libraries})
    list(APPEND objects $<TARGET_OBJECTS:${library}>)
endforeach()

# Linked whole: creatable classes enter themselves in the class registry when their object is loaded, and nothing
# else refers to those objects.
add_library(zelt_internal_archive STATIC ${objects})
add_library(zelt_internal INTERFACE)
target_include_directories(zelt_internal INTERFACE ${PROJECT_SOURCE_DIR}/include ${PROJECT_SOURCE_DIR}/src)
target_link_libraries(zelt_internal INTERFACE
    "$<LINK_LIBRARY:WHOLE_ARCHIVE,zelt_internal_archive>" ${system_libraries} Threads::Threads ${CMAKE_DL_LIBS})

if(NOT ZELT_FUZZ)
    add_library(zelt SHARED ${objects})
    add_library(zelt::zelt ALIAS zelt)
    set_target_properties(zelt PROPERTIES VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR} INSTALL_RPATH "")
    target_compile_features(zelt INTERFACE cxx_std_20)
    target_include_directories(zelt INTERFACE
        $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include> $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
    target_link_libraries(zelt PRIVATE ${system_libraries} Threads::Threads ${CMAKE_DL_LIBS})
    target_link_options(zelt PRIVATE
        -Wl,--exclude-libs,ALL -Wl,--version-script=${PROJECT_SOURCE_DIR}/cmake/zelt.map)
    set_property(TARGET zelt APPEND PROPERTY LINK_DEPENDS ${PROJECT_SOURCE_DIR}/cmake/zelt.map)
    # Clang leaves the sanitizers' own symbols to the executable.
    if(NOT (ZELT_SANITIZE AND CMAKE_CXX_COMPILER_ID MATCHES "Clang"))
        target_link_options(zelt PRIVATE -Wl,--no-undefined)
    endif()
endif()
