# Target helpers shared by the host, the module, the tests and the benchmarks.

# Host code includes its headers from host/ ("drawing/Database.h", "sdk/Document.h").
# Host libraries publish no include folders, so the module cannot reach them by linking.
function(zv_use_host_headers target)
    target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR}/host)
endfunction()

# One shared library per host subsystem, from the .cpp files of its folder.
function(zv_host_library name folder)
    cmake_parse_arguments(ARG "" "" "LIBS" ${ARGN})
    file(GLOB sources CONFIGURE_DEPENDS ${folder}/*.cpp)
    if(NOT sources)
        add_library(${name} INTERFACE)
        return()
    endif()
    add_library(${name} SHARED ${sources})
    zv_use_host_headers(${name})
    target_link_libraries(${name} PUBLIC ${ARG_LIBS})
endfunction()

# A GoogleTest executable from the .cpp files of a tests/ folder.
function(zv_test_folder name)
    cmake_parse_arguments(ARG "HOST;MODULE" "" "LIBS" ${ARGN})
    file(GLOB sources CONFIGURE_DEPENDS ${CMAKE_CURRENT_SOURCE_DIR}/*.cpp)
    if(NOT sources)
        message(WARNING "${CMAKE_CURRENT_SOURCE_DIR} has no test sources yet")
        return()
    endif()
    add_executable(${name} ${sources})
    set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/tests)
    target_link_libraries(${name} PRIVATE ${ARG_LIBS} GTest::gtest GTest::gmock GTest::gtest_main)
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR} ${PROJECT_SOURCE_DIR}/tests)
    if(ARG_HOST)
        zv_use_host_headers(${name})
    endif()
    target_compile_definitions(${name} PRIVATE
        ZV_BIN_DIR="${ZV_BIN_DIR}" ZV_SOURCE_DIR="${PROJECT_SOURCE_DIR}"
        ZV_TEST_DIR="${CMAKE_CURRENT_SOURCE_DIR}")
    gtest_discover_tests(${name} DISCOVERY_TIMEOUT 60
        PROPERTIES ENVIRONMENT "QT_QPA_PLATFORM=offscreen")
endfunction()
