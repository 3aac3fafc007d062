# Tests of liblumeris's text utilities and entity IDs.
lumeris_add_gtest(lumeris_text_test
  SOURCES
    ${CMAKE_CURRENT_LIST_DIR}/text/code_string_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/text/emoji_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/text/scalar_test.cc
  LIBS lumeris
  LABELS text)
lumeris_add_gtest(lumeris_entity_test
  SOURCES
    ${CMAKE_CURRENT_LIST_DIR}/entity/entity_id_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/entity/vistrel_item_test.cc
  LIBS lumeris
  LABELS entity)
