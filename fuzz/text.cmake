# lumeris_text_fuzz: code strings and entity IDs, the text functions that read untrusted input.
add_executable(lumeris_text_fuzz ${CMAKE_CURRENT_LIST_DIR}/text_fuzz.cc)
target_compile_options(lumeris_text_fuzz PRIVATE -fsanitize=fuzzer)
target_link_options(lumeris_text_fuzz PRIVATE -fsanitize=fuzzer)
target_link_libraries(lumeris_text_fuzz PRIVATE lumeris)
