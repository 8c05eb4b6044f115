# Reading and writing image files, apart from the commands so that tests and fuzz targets can have it alone.

find_path(ZELT_OPENCV_INCLUDE opencv2/imgcodecs.hpp PATH_SUFFIXES opencv4 REQUIRED)
find_library(ZELT_OPENCV_CORE opencv_core REQUIRED)
find_library(ZELT_OPENCV_IMGPROC opencv_imgproc REQUIRED)
find_library(ZELT_OPENCV_IMGCODECS opencv_imgcodecs REQUIRED)
find_package(PkgConfig REQUIRED)
pkg_check_modules(CFITSIO REQUIRED IMPORTED_TARGET cfitsio)

# zelt_image_files LIBRARY: which of the library's two forms the files are built against.
function(zelt_image_files library)
    set(folder ${PROJECT_SOURCE_DIR}/hosts/cli)
    add_library(zelt_image_files STATIC ${folder}/image_file.cpp ${folder}/image_pixels.cpp ${folder}/output_file.cpp
        ${folder}/tiff_directory.cpp ${folder}/tiff_reader.cpp ${folder}/tiff_writer.cpp ${folder}/opencv_file.cpp
        ${folder}/fits_file.cpp)
    target_include_directories(zelt_image_files PUBLIC ${folder})
    target_include_directories(zelt_image_files SYSTEM PUBLIC ${ZELT_OPENCV_INCLUDE})
    target_link_libraries(zelt_image_files PUBLIC ${library} ${ZELT_OPENCV_IMGCODECS} ${ZELT_OPENCV_IMGPROC}
        ${ZELT_OPENCV_CORE} PkgConfig::CFITSIO)
endfunction()
