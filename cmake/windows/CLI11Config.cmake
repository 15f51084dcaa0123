# CLI11's headers alone: the folder they lie in holds the headers of another system, too.
file(MAKE_DIRECTORY ${PROJECT_BINARY_DIR}/headers)
file(CREATE_LINK /usr/include/CLI ${PROJECT_BINARY_DIR}/headers/CLI SYMBOLIC)
if(NOT TARGET CLI11::CLI11)
  add_library(CLI11::CLI11 INTERFACE IMPORTED)
  target_include_directories(CLI11::CLI11 INTERFACE ${PROJECT_BINARY_DIR}/headers)
endif()
