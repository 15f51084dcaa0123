# What `cpack` makes of the build: Debian packages (library, development, tools) and a zip archive of all.
# Scripts/package does it from the sources.
set(CPACK_PACKAGE_NAME hpnssa)
set(CPACK_PACKAGE_VENDOR "HpnSSA developers")
set(CPACK_PACKAGE_CONTACT "HpnSSA developers <hpnssa@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "optimiser for control programs in static single assignment form")
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_STRIP_FILES ON)
set(CPACK_COMPONENTS_ALL library development tools)
set(CPACK_GENERATOR DEB ZIP)

# One archive with everything.
set(CPACK_ARCHIVE_COMPONENT_INSTALL OFF)
set(CPACK_ZIP_COMPONENT_INSTALL OFF)

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_LIBRARY_PACKAGE_NAME libhpnssa${PROJECT_VERSION_MAJOR})
set(CPACK_DEBIAN_LIBRARY_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_LIBRARY_PACKAGE_CONTROL_EXTRA ${CMAKE_CURRENT_LIST_DIR}/triggers)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libhpnssa-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SHLIBDEPS OFF)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS
  "${CPACK_DEBIAN_LIBRARY_PACKAGE_NAME} (= ${PROJECT_VERSION}), libstdc++-12-dev | libstdc++-dev")
set(CPACK_DEBIAN_TOOLS_PACKAGE_NAME hpnssa-tools)
set(CPACK_DEBIAN_TOOLS_PACKAGE_SECTION devel)
# hpncg --report draws with it, and does without.
set(CPACK_DEBIAN_TOOLS_PACKAGE_RECOMMENDS graphviz)
set(CPACK_COMPONENT_LIBRARY_DESCRIPTION
  "Shared libraries\nThe optimising middle of a production code generator for embedded controllers:\nwhole programs in static single assignment form, constants with ranges over\nfixed-point variables, dead code, inlining, hoisting.")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION
  "Headers and static libraries\nWhat is needed to build a client of HpnSSA: headers, static libraries, the\nCMake package and the pkg-config file.")
set(CPACK_COMPONENT_TOOLS_DESCRIPTION
  "Code generator for control programs\nhpncg reads control programs in a typed language, optimises them as a\nwhole and writes readable C99 whose outputs are bit for bit those of the\nprogram as written.")
include(CPack)
