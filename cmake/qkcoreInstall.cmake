# What `cmake --install` adds beside the targets' own install rules (the
# library and the codec module in the library directory, qkimage in bin/):
# the public headers, the CMake package `find_package(qkcore)` with the
# imported target qkcore::qkcore, and the pkg-config file qkcore.pc.
include(CMakePackageConfigHelpers)

install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/qkcore
  DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} FILES_MATCHING PATTERN "*.h")

set(QK_PACKAGE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/qkcore)
install(EXPORT qkcoreTargets NAMESPACE qkcore:: DESTINATION ${QK_PACKAGE_DIR})
configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/qkcoreConfig.cmake.in
  ${PROJECT_BINARY_DIR}/qkcoreConfig.cmake INSTALL_DESTINATION ${QK_PACKAGE_DIR})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/qkcoreConfigVersion.cmake
  COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/qkcoreConfig.cmake ${PROJECT_BINARY_DIR}/qkcoreConfigVersion.cmake
  DESTINATION ${QK_PACKAGE_DIR})

# `cmake --install --prefix` moves the tree after configuration, so the file
# names its directories relative to where it lies, not by the configured
# prefix.
file(RELATIVE_PATH QK_PC_PREFIX ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" QK_PC_PREFIX "${QK_PC_PREFIX}")
file(RELATIVE_PATH QK_PC_LIBDIR ${CMAKE_INSTALL_PREFIX} ${CMAKE_INSTALL_FULL_LIBDIR})
file(RELATIVE_PATH QK_PC_INCLUDEDIR ${CMAKE_INSTALL_PREFIX} ${CMAKE_INSTALL_FULL_INCLUDEDIR})
configure_file(${CMAKE_CURRENT_LIST_DIR}/qkcore.pc.in ${PROJECT_BINARY_DIR}/qkcore.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/qkcore.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
