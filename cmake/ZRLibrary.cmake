# The objects, compiled once; the shared library shows exports only, tests and benchmarks link the objects
# and so reach what is hidden in the product.
find_package(spdlog REQUIRED)
find_package(PkgConfig REQUIRED)
find_package(Threads REQUIRED)
pkg_check_modules(LCMS2 REQUIRED IMPORTED_TARGET lcms2)
find_package(Boost 1.70 REQUIRED)
find_path(ZR_XXHASH_FOLDER xxhash.h REQUIRED)
find_path(ZR_HIGHWAY_FOLDER hwy/highway.h REQUIRED)

# Highway checks indices in builds for sanitizers and debuggers, and then needs its library to say what it found.
set(zr_highway)
if(ZR_SANITIZE OR CMAKE_BUILD_TYPE STREQUAL "Debug")
  find_library(ZR_HIGHWAY hwy REQUIRED)
  set(zr_highway ${ZR_HIGHWAY})
endif()

get_property(zr_sources GLOBAL PROPERTY ZR_LIBRARY_SOURCES)
add_library(zr_objects OBJECT ${zr_sources})
target_include_directories(zr_objects
  PUBLIC $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>
  PRIVATE ${PROJECT_SOURCE_DIR}/platform ${PROJECT_SOURCE_DIR}/pkg/ZR/indep)
# Vector rows are compiled for SSE4, AVX2 and AVX-512; what lies between is not worth the time.
target_compile_definitions(zr_objects PRIVATE HWY_DISABLED_TARGETS=\(HWY_SSSE3|HWY_AVX3_DL\) HWY_DISABLE_PCLMUL_AES)
target_link_libraries(zr_objects PUBLIC zr_rules Boost::headers PRIVATE spdlog::spdlog PkgConfig::LCMS2)
set_target_properties(zr_objects PROPERTIES
  POSITION_INDEPENDENT_CODE ON
  C_VISIBILITY_PRESET hidden
  CXX_VISIBILITY_PRESET hidden
  VISIBILITY_INLINES_HIDDEN ON)

# Private headers and objects, for tests and benchmarks.
add_library(zr_internal INTERFACE)
target_include_directories(zr_internal INTERFACE
  ${PROJECT_SOURCE_DIR}/include ${PROJECT_SOURCE_DIR}/platform ${PROJECT_SOURCE_DIR}/pkg/ZR/indep)
target_link_libraries(zr_internal INTERFACE zr_objects $<TARGET_OBJECTS:zr_objects> zr_rules
  spdlog::spdlog PkgConfig::LCMS2 Boost::headers Threads::Threads ${zr_highway} ${CMAKE_DL_LIBS})

add_library(zr SHARED)
add_library(zr_static STATIC)
target_link_options(zr PRIVATE -Wl,--version-script=${PROJECT_SOURCE_DIR}/cmake/zr.map)
if(NOT ZR_SANITIZE)  # clang leaves the sanitizer's names to the program
  target_link_options(zr PRIVATE -Wl,--no-undefined)
endif()
set_target_properties(zr PROPERTIES LINK_DEPENDS ${PROJECT_SOURCE_DIR}/cmake/zr.map)
set_target_properties(zr PROPERTIES VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR})
set_target_properties(zr_static PROPERTIES OUTPUT_NAME zr EXPORT_NAME zr_static)
foreach(library zr zr_static)
  target_link_libraries(${library} PRIVATE $<BUILD_INTERFACE:zr_objects> $<BUILD_INTERFACE:zr_rules>)
  target_sources(${library} PRIVATE $<TARGET_OBJECTS:zr_objects>)
  target_link_libraries(${library} PRIVATE spdlog::spdlog PkgConfig::LCMS2 Threads::Threads ${zr_highway} ${CMAKE_DL_LIBS})
  target_link_libraries(${library} PUBLIC Boost::headers)
  target_include_directories(${library} INTERFACE
    $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include> $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>)
  add_library(ZR::${library} ALIAS ${library})
endforeach()
