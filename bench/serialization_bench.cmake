# protobuf is the reference of this benchmark only; without it the benchmark
# runs its own cases and says that the reference is missing.
find_package(Protobuf QUIET)
if(Protobuf_FOUND AND Protobuf_PROTOC_EXECUTABLE)
  protobuf_generate_cpp(BENCH_PROTO_SRCS BENCH_PROTO_HDRS ${CMAKE_CURRENT_SOURCE_DIR}/serialization.proto)
  target_sources(serialization_bench PRIVATE ${BENCH_PROTO_SRCS})
  target_include_directories(serialization_bench PRIVATE ${CMAKE_CURRENT_BINARY_DIR})
  target_link_libraries(serialization_bench PRIVATE protobuf::libprotobuf)
  target_compile_definitions(serialization_bench PRIVATE LODESTACK_BENCH_HAVE_PROTOBUF=1)
else()
  message(STATUS "protobuf not found: serialization_bench runs without its reference")
endif()
