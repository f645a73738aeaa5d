# zarvo_target(TARGET): the language, warnings and sanitizers every target of this project is built with.
set(ZARVO_SOURCE_DIR "${CMAKE_CURRENT_LIST_DIR}/..")

function(zarvo_target target)
  target_compile_features(${target} PRIVATE cxx_std_20)
  set_target_properties(${target} PROPERTIES CXX_EXTENSIONS OFF POSITION_INDEPENDENT_CODE ON)
  target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic -Wshadow -Wconversion)
  if(ZARVO_WERROR)
    target_compile_options(${target} PRIVATE -Werror)
  endif()
  if(ZARVO_SANITIZE)
    target_compile_options(${target} PRIVATE -fsanitize=${ZARVO_SANITIZE} -fno-omit-frame-pointer)
    target_link_options(${target} PRIVATE -fsanitize=${ZARVO_SANITIZE})
  endif()
endfunction()

# zarvo_program(NAME SOURCES...): a program that knows its version.
function(zarvo_program name)
  add_executable(${name} ${ARGN})
  zarvo_target(${name})
  target_compile_definitions(${name} PRIVATE ZARVO_VERSION="${PROJECT_VERSION}")
endfunction()
