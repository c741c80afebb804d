# The package: public headers, both libraries, the hostkit, the tool, and two ways to find them.
include(CMakePackageConfigHelpers)

install(DIRECTORY include/ZR DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} FILES_MATCHING PATTERN "*.h"
  PATTERN hostkit.h EXCLUDE)
install(TARGETS zr zr_static EXPORT ZRTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
  ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
if(TARGET zr_hostkit)
  install(FILES include/ZR/hostkit.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/ZR)
  install(TARGETS zr_hostkit EXPORT ZRTargets ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
endif()
file(GLOB examples CONFIGURE_DEPENDS examples/*.c examples/*.h)
install(FILES ${examples} examples/CMakeLists.txt DESTINATION ${CMAKE_INSTALL_DATADIR}/zr/examples)
if(TARGET zr_tool)
  set_target_properties(zr_tool PROPERTIES INSTALL_RPATH "$ORIGIN/../${CMAKE_INSTALL_LIBDIR}")
  install(TARGETS zr_tool RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
endif()

set(ZR_CONFIG_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/ZR)
install(EXPORT ZRTargets NAMESPACE ZR:: DESTINATION ${ZR_CONFIG_DIR})
configure_package_config_file(cmake/ZRConfig.cmake.in ${PROJECT_BINARY_DIR}/ZRConfig.cmake
  INSTALL_DESTINATION ${ZR_CONFIG_DIR})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/ZRConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/ZRConfig.cmake ${PROJECT_BINARY_DIR}/ZRConfigVersion.cmake
  DESTINATION ${ZR_CONFIG_DIR})
configure_file(cmake/zr.pc.in ${PROJECT_BINARY_DIR}/zr.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/zr.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
