# Every third-party library comes from a Debian package that scripts/setup.sh installs.
find_package(PkgConfig REQUIRED)
find_package(Threads REQUIRED)
find_package(SQLite3 REQUIRED)
find_package(ICU REQUIRED COMPONENTS uc i18n data)
find_package(nlohmann_json 3 REQUIRED)
find_package(CLI11 REQUIRED)
# msgpack-c's C++ API is header-only (libmsgpack-cxx-dev).
find_path(MSGPACK_CXX_INCLUDE_DIR msgpack.hpp REQUIRED)
find_package(pugixml REQUIRED)
find_package(BZip2 REQUIRED)
find_package(Freetype REQUIRED)
find_package(Fontconfig REQUIRED)

pkg_check_modules(PLIST REQUIRED IMPORTED_TARGET libplist-2.0)
pkg_check_modules(SYSTEMD REQUIRED IMPORTED_TARGET libsystemd)
pkg_check_modules(PANGO REQUIRED IMPORTED_TARGET pangocairo pangoft2)
pkg_check_modules(CAIRO REQUIRED IMPORTED_TARGET cairo)
pkg_check_modules(XCB REQUIRED IMPORTED_TARGET xcb)

# Standalone Asio is header-only.
add_library(lumeris_asio INTERFACE)
target_compile_definitions(lumeris_asio INTERFACE ASIO_STANDALONE ASIO_NO_DEPRECATED)
target_link_libraries(lumeris_asio INTERFACE Threads::Threads)

# msgpack-c's C++ headers, without Boost.
add_library(lumeris_msgpack INTERFACE)
target_include_directories(lumeris_msgpack SYSTEM INTERFACE ${MSGPACK_CXX_INCLUDE_DIR})
target_compile_definitions(lumeris_msgpack INTERFACE MSGPACK_NO_BOOST)

if(LUMERIS_BUILD_TESTS)
  find_package(GTest REQUIRED)
  include(GoogleTest)
endif()
if(LUMERIS_BUILD_BENCH)
  find_package(benchmark REQUIRED)
endif()
