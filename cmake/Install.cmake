# What `cmake --install` puts where. Components: library (to run), development (to build clients), tools (the driver).
include(CMakePackageConfigHelpers)
set(PACKAGE_FOLDER ${CMAKE_INSTALL_LIBDIR}/cmake/HpnSSA)

set(INSTALLED_TARGETS HpnSSAInterfaces)
foreach(TARGET HpnSSAStatic HpnSSAShared HpnSSAPlatformStatic HpnSSAPlatformShared)
  if(TARGET ${TARGET})
    list(APPEND INSTALLED_TARGETS ${TARGET})
  endif()
endforeach()
install(TARGETS ${INSTALLED_TARGETS} EXPORT HpnSSATargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT library NAMELINK_COMPONENT development
  ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT development
  RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT library)

# Headers, in a folder for each layer: whoever brings another platform uses the first alone.
install(DIRECTORY Core/HpnSSA/Sources/HpnSSA/ DESTINATION ${HPNSSA_INCLUDE_DIR}/library COMPONENT development
  FILES_MATCHING PATTERN *.h)
if(HPNSSA_PLATFORM)
  install(DIRECTORY Core/Interfaces/ DESTINATION ${HPNSSA_INCLUDE_DIR}/interfaces COMPONENT development
    FILES_MATCHING PATTERN *.h)
  install(DIRECTORY Core/Platform/ DESTINATION ${HPNSSA_INCLUDE_DIR}/platform COMPONENT development
    FILES_MATCHING PATTERN *.h)
endif()

# The CMake package and the pkg-config file.
install(EXPORT HpnSSATargets NAMESPACE HpnSSA:: DESTINATION ${PACKAGE_FOLDER} COMPONENT development)
configure_package_config_file(cmake/HpnSSAConfig.cmake.in HpnSSAConfig.cmake INSTALL_DESTINATION ${PACKAGE_FOLDER})
write_basic_package_version_file(HpnSSAConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/HpnSSAConfig.cmake ${CMAKE_CURRENT_BINARY_DIR}/HpnSSAConfigVersion.cmake
  DESTINATION ${PACKAGE_FOLDER} COMPONENT development)
if(HPNSSA_PLATFORM)
  # The file tells the prefix by its own place, so that the whole can be moved.
  file(RELATIVE_PATH PREFIX_FROM_FILE /prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig /prefix)
  configure_file(cmake/hpnssa.pc.in hpnssa.pc @ONLY)
  install(FILES ${CMAKE_CURRENT_BINARY_DIR}/hpnssa.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)
endif()

# The driver, its manual page and its completion; the header that the emitted C includes lies beside its output anyway.
if(TARGET hpncg)
  install(TARGETS hpncg RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT tools)
  if(TARGET hpncg_manual)
    set(GENERATED ${CMAKE_CURRENT_BINARY_DIR}/CodeGenerator)
    set(MANUAL ${GENERATED}/hpncg.1)
    # A Debian package holds its manual pages compressed.
    if(CMAKE_INSTALL_PREFIX STREQUAL "/usr")
      install(CODE "execute_process(COMMAND gzip -9nkf ${MANUAL} COMMAND_ERROR_IS_FATAL ANY)" COMPONENT tools)
      set(MANUAL ${MANUAL}.gz)
    endif()
    install(FILES ${MANUAL} DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT tools)
    install(FILES ${GENERATED}/hpncg.bash DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions
      COMPONENT tools RENAME hpncg)
  endif()
endif()

# A Debian package tells whose it is.
if(CMAKE_INSTALL_PREFIX STREQUAL "/usr")
  foreach(PACKAGE library:libhpnssa${PROJECT_VERSION_MAJOR} development:libhpnssa-dev tools:hpnssa-tools)
    string(REPLACE ":" ";" PACKAGE ${PACKAGE})
    list(GET PACKAGE 0 COMPONENT)
    list(GET PACKAGE 1 NAME)
    install(FILES cmake/copyright DESTINATION share/doc/${NAME} COMPONENT ${COMPONENT})
  endforeach()
endif()
