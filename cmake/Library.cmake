find_package(Threads REQUIRED)

# tarn_library(name SOURCES file... [DEPENDS target...])
# A static library. Includes are written from the root of the tree ("proto/VelmoMessage.h").
function(tarn_library name)
    cmake_parse_arguments(arg "" "" "SOURCES;DEPENDS" ${ARGN})
    add_library(${name} STATIC ${arg_SOURCES})
    target_include_directories(${name} PUBLIC ${PROJECT_SOURCE_DIR})
    target_link_libraries(${name} PUBLIC ${arg_DEPENDS} Threads::Threads PRIVATE $<BUILD_INTERFACE:tarn_warnings>)
endfunction()

# tarn_room(room SOURCES file... [ROOMS room...] [LIBRARIES target...])
# The library of one room, a folder of the tree: "sound/pulse" becomes tarn_sound_pulse. ROOMS are all the rooms whose
# headers it may include; script/layers holds every #include to that. LIBRARIES are those of others, and stay inside.
function(tarn_room room)
    cmake_parse_arguments(arg "" "" "SOURCES;ROOMS;LIBRARIES" ${ARGN})
    list(TRANSFORM arg_ROOMS PREPEND tarn_)
    string(REPLACE "/" "_" name "tarn_${room}")
    string(REPLACE "/" "_" rooms "${arg_ROOMS}")
    tarn_library(${name} SOURCES ${arg_SOURCES} DEPENDS ${rooms})
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES})
endfunction()

# tarn_module(name ROOM room SOURCES file... [LIBRARIES target...])
# A room as libtarn-<name>.so, which the service loads when it first needs it and which exports what Module.cpp
# says alone.
function(tarn_module name)
    cmake_parse_arguments(arg "" "ROOM" "SOURCES;LIBRARIES" ${ARGN})
    add_library(tarn_${name}_module MODULE ${arg_SOURCES})
    target_link_libraries(tarn_${name}_module PRIVATE tarn_${arg_ROOM} ${arg_LIBRARIES} tarn_warnings)
    set_target_properties(tarn_${name}_module PROPERTIES
        OUTPUT_NAME tarn-${name} PREFIX lib CXX_VISIBILITY_PRESET hidden
        LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/modules)
    target_link_options(tarn_${name}_module PRIVATE -Wl,--exclude-libs,ALL)
    install(TARGETS tarn_${name}_module DESTINATION ${CMAKE_INSTALL_LIBDIR}/tarn)
endfunction()

# tarn_test(name SOURCES file... [DEPENDS target...] [ARGS argument...] [TIMEOUT seconds])
# A GoogleTest program, run as one ctest test.
function(tarn_test name)
    cmake_parse_arguments(arg "" "TIMEOUT" "SOURCES;DEPENDS;ARGS" ${ARGN})
    add_executable(${name} ${arg_SOURCES})
    target_link_libraries(${name} PRIVATE ${arg_DEPENDS} GTest::gmock_main tarn_warnings)
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR})
    add_test(NAME ${name} COMMAND ${name} ${arg_ARGS})
    if(arg_TIMEOUT)
        set_tests_properties(${name} PROPERTIES TIMEOUT ${arg_TIMEOUT})
    else()
        set_tests_properties(${name} PROPERTIES TIMEOUT 300)
    endif()
endfunction()

# tarn_fuzz(name SOURCES file... [DEPENDS target...]): a libFuzzer target; its seeds are in fuzz/corpus/<name>.
function(tarn_fuzz name)
    cmake_parse_arguments(arg "" "" "SOURCES;DEPENDS" ${ARGN})
    add_executable(${name} ${arg_SOURCES})
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR})
    target_link_libraries(${name} PRIVATE ${arg_DEPENDS} tarn_warnings -fsanitize=fuzzer)
endfunction()

# tarn_bench(name SOURCES file... [DEPENDS target...]): a benchmark program, run by script/bench.
function(tarn_bench name)
    cmake_parse_arguments(arg "" "" "SOURCES;DEPENDS" ${ARGN})
    add_executable(${name} ${arg_SOURCES})
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR})
    target_link_libraries(${name} PRIVATE ${arg_DEPENDS} tarn_warnings)
endfunction()
