# lumeris_wire_fuzz: the bytes a client can send, through the frame decoder to the request
# dispatch (with recording operations).
add_executable(lumeris_wire_fuzz ${CMAKE_CURRENT_LIST_DIR}/wire_fuzz.cc)
target_compile_options(lumeris_wire_fuzz PRIVATE -fsanitize=fuzzer)
target_link_options(lumeris_wire_fuzz PRIVATE -fsanitize=fuzzer)
target_link_libraries(lumeris_wire_fuzz PRIVATE lumeris_service)
