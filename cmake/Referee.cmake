# The messages as libprotobuf's C++ classes, for tests and benchmarks that compare with it.
# tarn_referee() makes the target tarn_referee; include "velmo.pb.h".
function(tarn_referee)
    if(TARGET tarn_referee)
        return()
    endif()
    find_package(Protobuf REQUIRED)
    set(directory ${PROJECT_BINARY_DIR}/referee)
    file(MAKE_DIRECTORY ${directory})
    add_custom_command(
        OUTPUT ${directory}/velmo.pb.cc ${directory}/velmo.pb.h
        COMMAND protobuf::protoc --proto_path=${PROJECT_SOURCE_DIR}/proto --cpp_out=${directory} velmo.proto
        DEPENDS ${PROJECT_SOURCE_DIR}/proto/velmo.proto)
    add_library(tarn_referee STATIC ${directory}/velmo.pb.cc)
    target_include_directories(tarn_referee SYSTEM PUBLIC ${directory})
    target_link_libraries(tarn_referee PUBLIC protobuf::libprotobuf Threads::Threads)
endfunction()
