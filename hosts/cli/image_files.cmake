# Reading and writing image files, apart from the commands so that tests and fuzz targets can have it alone.

find_path(ZELT_OPENCV_INCLUDE opencv2/imgcodecs.hpp PATH_SUFFIXES opencv4 REQUIRED)
find_library(ZELT_OPENCV_CORE opencv_core REQUIRED)
find_library(ZELT_OPENCV_IMGCODECS opencv_imgcodecs REQUIRED)
set(ZELT_OPENCV ${ZELT_OPENCV_IMGCODECS} ${ZELT_OPENCV_CORE})
find_package(PkgConfig REQUIRED)
pkg_check_modules(CFITSIO REQUIRED IMPORTED_TARGET cfitsio)

# zelt_image_files LIBRARY: which of the library's two forms the files are built against. With the shared one the codecs
# become a module beside it, else they are linked in.
function(zelt_image_files library)
    set(folder ${PROJECT_SOURCE_DIR}/hosts/cli)
    add_library(zelt_image_files STATIC ${folder}/image_file.cpp ${folder}/image_pixels.cpp ${folder}/output_file.cpp
        ${folder}/tiff_directory.cpp ${folder}/tiff_reader.cpp ${folder}/tiff_writer.cpp ${folder}/png_file.cpp
        ${folder}/fits_file.cpp ${folder}/codecs.cpp)
    target_include_directories(zelt_image_files PUBLIC ${folder} ${PROJECT_SOURCE_DIR}/hosts)
    target_link_libraries(zelt_image_files PUBLIC ${library} PkgConfig::CFITSIO ${CMAKE_DL_LIBS})

    if(library STREQUAL zelt)
        add_library(zelt_codecs MODULE ${folder}/codecs/opencv_codecs.cpp)
        target_link_libraries(zelt_codecs PRIVATE zelt_image_files)
    else()
        add_library(zelt_codecs OBJECT ${folder}/codecs/opencv_codecs.cpp)
        target_include_directories(zelt_codecs PRIVATE ${folder} ${PROJECT_SOURCE_DIR}/hosts)
        target_link_libraries(zelt_codecs PRIVATE ${library})
        target_sources(zelt_image_files PRIVATE $<TARGET_OBJECTS:zelt_codecs>)
        target_compile_definitions(zelt_image_files PRIVATE ZELT_CODECS_LINKED)
        target_link_libraries(zelt_image_files PUBLIC ${ZELT_OPENCV})
    endif()
    target_include_directories(zelt_codecs SYSTEM PRIVATE ${ZELT_OPENCV_INCLUDE})
    target_link_libraries(zelt_codecs PRIVATE ${ZELT_OPENCV})
endfunction()
