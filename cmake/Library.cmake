find_package(Threads REQUIRED)

# tarn_library(name SOURCES file... [DEPENDS target...])
# One static library per folder. Includes are written from the root of the tree ("proto/VelmoMessage.h").
function(tarn_library name)
    cmake_parse_arguments(arg "" "" "SOURCES;DEPENDS" ${ARGN})
    add_library(${name} STATIC ${arg_SOURCES})
    target_include_directories(${name} PUBLIC ${PROJECT_SOURCE_DIR})
    target_link_libraries(${name} PUBLIC ${arg_DEPENDS} Threads::Threads PRIVATE $<BUILD_INTERFACE:tarn_warnings>)
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
