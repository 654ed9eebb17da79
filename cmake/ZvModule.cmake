# The ZVListas module: libzvlistas.so, loaded by the host at run time.
# zvl_core holds every module source but the exported entry, so tests link it directly.
set(zvl_sources "")
foreach(folder IN LISTS ZV_MODULE_FOLDERS)
    file(GLOB folder_sources CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/${folder}/*.cpp)
    list(APPEND zvl_sources ${folder_sources})
endforeach()
list(REMOVE_ITEM zvl_sources ${PROJECT_SOURCE_DIR}/module/ModuleExports.cpp)

# Workbooks for the XLSX export are zip archives of XML parts.
# (through pkg-config: Debian's libzip CMake files want its command-line tools too)
find_package(PkgConfig REQUIRED)
pkg_check_modules(LIBZIP REQUIRED IMPORTED_TARGET libzip)
find_package(pugixml REQUIRED)

add_library(zvl_core STATIC ${zvl_sources})
target_include_directories(zvl_core PUBLIC ${PROJECT_SOURCE_DIR})
target_link_libraries(zvl_core PUBLIC Qt5::Core Qt5::Gui Qt5::Widgets Qt5::Sql Qt5::Xml
    zvhostcore zvdrawing zvlisp)
target_link_libraries(zvl_core PRIVATE PkgConfig::LIBZIP pugixml::pugixml)
# The PDF export joins pages and adds bookmarks and links with Debian's qpdf library.
target_link_libraries(zvl_core PUBLIC qpdf)
target_compile_definitions(zvl_core PUBLIC POINTERHOLDER_TRANSITION=4)

# Only cad/ sees the host's own headers.
file(GLOB cad_sources CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/cad/*.cpp)
set_source_files_properties(${cad_sources} TARGET_DIRECTORY zvl_core
    PROPERTIES INCLUDE_DIRECTORIES ${PROJECT_SOURCE_DIR}/host)

add_library(zvlistas SHARED ${PROJECT_SOURCE_DIR}/module/ModuleExports.cpp)
target_link_libraries(zvlistas PRIVATE "$<LINK_LIBRARY:WHOLE_ARCHIVE,zvl_core>")
