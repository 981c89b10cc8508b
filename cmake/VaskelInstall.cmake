# Install rules: headers, libraries, the CMake package and pkg-config file.
include(CMakePackageConfigHelpers)

set(VASKEL_CMAKE_DIR "${CMAKE_INSTALL_LIBDIR}/cmake/vaskel")
set(VASKEL_TARGETS vaskel)
if(NOT WIN32)
    list(APPEND VASKEL_TARGETS vaskel-win32)
    install(DIRECTORY win32/include/vkwin32 DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
endif()
install(DIRECTORY include/vaskel DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(TARGETS ${VASKEL_TARGETS} EXPORT vaskelTargets
    RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR}
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
    ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
if(TARGET vaskel-reg)
    install(TARGETS vaskel-reg RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
endif()
if(VASKEL_RUNTIME_DLLS)
    install(FILES ${VASKEL_RUNTIME_DLLS} DESTINATION ${CMAKE_INSTALL_BINDIR})
endif()
install(EXPORT vaskelTargets NAMESPACE vaskel:: DESTINATION ${VASKEL_CMAKE_DIR})

configure_package_config_file(cmake/vaskelConfig.cmake.in
    "${CMAKE_CURRENT_BINARY_DIR}/vaskelConfig.cmake"
    INSTALL_DESTINATION ${VASKEL_CMAKE_DIR})
write_basic_package_version_file("${CMAKE_CURRENT_BINARY_DIR}/vaskelConfigVersion.cmake"
    COMPATIBILITY SameMajorVersion)
install(FILES
    "${CMAKE_CURRENT_BINARY_DIR}/vaskelConfig.cmake"
    "${CMAKE_CURRENT_BINARY_DIR}/vaskelConfigVersion.cmake"
    DESTINATION ${VASKEL_CMAKE_DIR})

if(WIN32)
    set(VASKEL_PC_LIBS "-lvaskel")
else()
    set(VASKEL_PC_LIBS "-lvaskel -lvaskel-win32 -pthread")
endif()
configure_file(cmake/vaskel.pc.in "${CMAKE_CURRENT_BINARY_DIR}/vaskel.pc" @ONLY)
install(FILES "${CMAKE_CURRENT_BINARY_DIR}/vaskel.pc" DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
