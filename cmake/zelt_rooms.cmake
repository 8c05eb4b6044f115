# A room is a folder of src/: its sources become the object library zelt_<room>, and the sources
# named kernels/*_levels.cpp become one more object library for each instruction-set level.
# Nothing is listed by hand: a new file is found at the next build.
#
# A room that needs a library of the system says so in src/<room>/room.cmake, which is included after
# its targets are made: zelt_room_uses(<room> <library>...).

function(zelt_objects target)
    add_library(${target} OBJECT ${ARGN})
    target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR}/include ${PROJECT_SOURCE_DIR}/src)
    set_property(GLOBAL APPEND PROPERTY zelt_object_libraries ${target})
endfunction()

function(zelt_room name)
    file(GLOB sources CONFIGURE_DEPENDS
        ${PROJECT_SOURCE_DIR}/src/${name}/*.cpp ${PROJECT_SOURCE_DIR}/src/${name}/kernels/*.cpp)
    set(levelled ${sources})
    list(FILTER levelled INCLUDE REGEX "/kernels/[^/]*_levels\\.cpp$")
    list(FILTER sources EXCLUDE REGEX "/kernels/[^/]*_levels\\.cpp$")

    if(sources)
        zelt_objects(zelt_${name} ${sources})
    endif()
    if(levelled)
        foreach(level ${ZELT_LEVELS})
            zelt_objects(zelt_${name}_${level} ${levelled})
            target_compile_options(zelt_${name}_${level} PRIVATE ${ZELT_LEVEL_FLAGS_${level}})
            target_compile_definitions(zelt_${name}_${level} PRIVATE ZELT_LEVEL=${level})
            set_property(GLOBAL APPEND PROPERTY zelt_level_libraries_${level} zelt_${name}_${level})
        endforeach()
    endif()
    include(${PROJECT_SOURCE_DIR}/src/${name}/room.cmake OPTIONAL)
endfunction()

# Compiles a room against libraries and links them into libzelt, without a trace for its clients.
function(zelt_room_uses name)
    if(TARGET zelt_${name})
        target_link_libraries(zelt_${name} PRIVATE ${ARGN})
    endif()
    foreach(level ${ZELT_LEVELS})
        if(TARGET zelt_${name}_${level})
            target_link_libraries(zelt_${name}_${level} PRIVATE ${ARGN})
        endif()
    endforeach()
    set_property(GLOBAL APPEND PROPERTY zelt_system_libraries ${ARGN})
endfunction()
