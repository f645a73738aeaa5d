# The Debian packages, made by CPack: one for each component.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_CONTACT "Zarvo maintainers <maintainers@zarvo.example>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "")
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_BINARY_DIR}/debian)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_NAME zarvo)
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${PROJECT_BINARY_DIR}/sdk ${PROJECT_BINARY_DIR}/virtual_card)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_DEBUGINFO_PACKAGE ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)

configure_file(debian/shlibs.in debian/shlibs @ONLY)
configure_file(debian/changelog.in debian/changelog @ONLY)
# gzipped(SOURCE NAME): compresses a file into the build folder, without a time.
function(gzipped source name)
  execute_process(COMMAND gzip -9nc ${source} OUTPUT_FILE ${CMAKE_CURRENT_BINARY_DIR}/debian/${name}
                  COMMAND_ERROR_IS_FATAL ANY)
endfunction()
gzipped(${CMAKE_CURRENT_BINARY_DIR}/debian/changelog changelog.Debian.gz)
gzipped(${PROJECT_SOURCE_DIR}/CHANGELOG.md changelog.gz)

# zarvo_package(NAME SECTION S SUMMARY S TEXT S [NEEDS PACKAGE...] [RECOMMENDS S] [SUGGESTS S] [CONTROL FILE...]):
# a package with the component of its name. Those it needs are others of this table; other dependencies come
# from the libraries that its files use.
function(zarvo_package name)
  cmake_parse_arguments(arg "" "SECTION;SUMMARY;TEXT;RECOMMENDS;SUGGESTS" "NEEDS;CONTROL" ${ARGN})
  string(TOUPPER ${name} key)
  set(CPACK_DEBIAN_${key}_PACKAGE_NAME ${name} PARENT_SCOPE)
  set(CPACK_DEBIAN_${key}_PACKAGE_SECTION ${arg_SECTION} PARENT_SCOPE)
  set(CPACK_DEBIAN_${key}_DESCRIPTION "${arg_SUMMARY}\n${arg_TEXT}" PARENT_SCOPE)
  set(CPACK_DEBIAN_${key}_PACKAGE_RECOMMENDS "${arg_RECOMMENDS}" PARENT_SCOPE)
  set(CPACK_DEBIAN_${key}_PACKAGE_SUGGESTS "${arg_SUGGESTS}" PARENT_SCOPE)
  set(CPACK_DEBIAN_${key}_PACKAGE_CONTROL_EXTRA "${arg_CONTROL}" PARENT_SCOPE)
  set(CPACK_COMPONENT_${key}_DEPENDS "${arg_NEEDS}" PARENT_SCOPE)
  set(CPACK_COMPONENTS_ALL ${CPACK_COMPONENTS_ALL} ${name} PARENT_SCOPE)
  install(FILES ${CMAKE_CURRENT_SOURCE_DIR}/debian/copyright
                ${CMAKE_CURRENT_BINARY_DIR}/debian/changelog.gz
                ${CMAKE_CURRENT_BINARY_DIR}/debian/changelog.Debian.gz
          DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/${name} COMPONENT ${name})
  set(overrides ${CMAKE_CURRENT_SOURCE_DIR}/debian/${name}.lintian-overrides)
  if(EXISTS ${overrides})
    install(FILES ${overrides} DESTINATION ${CMAKE_INSTALL_DATADIR}/lintian/overrides RENAME ${name} COMPONENT ${name})
  endif()
endfunction()

# CPack adds scripts that call ldconfig to a package with a library; "triggers" and own scripts take their place.
set(control ${CMAKE_CURRENT_SOURCE_DIR}/debian)
set(card "The Zarvo capture card has 16 video channels and 4 audio inputs.")
zarvo_package(libzarvo-sdk1 SECTION libs
  SUMMARY "library that drives a Zarvo capture card"
  TEXT "${card}
The library records its channels as MPEG-4 or Motion JPEG, shows them
live, and detects motion.
.
This package has the shared library, and gives the group video access to
the card."
  CONTROL ${control}/triggers ${CMAKE_CURRENT_BINARY_DIR}/debian/shlibs ${control}/libzarvo-sdk1/postinst
          ${control}/nothing/postrm)
zarvo_package(libzarvo-sdk-dev SECTION libdevel NEEDS libzarvo-sdk1
  SUMMARY "development files of the Zarvo Capture SDK"
  TEXT "${card}
The library records its channels as MPEG-4 or Motion JPEG, shows them
live, and detects motion.
.
This package has what a C or C++ program needs to use the library:
headers, the static library, files for CMake and pkg-config, and the
documentation of all functions as HTML."
  SUGGESTS zarvo-virtual-card)
zarvo_package(zarvo-virtual-card SECTION devel
  SUMMARY "stand-in for a Zarvo capture card and its driver"
  TEXT "${card}
The virtual card takes the place of the card and its driver on any
machine: it draws cameras and encodes their pictures as the card does.
Programs for the card run on it unchanged.
.
The program zarvo_card changes, breaks and watches the virtual card while
they run."
  SUGGESTS libzarvo-sdk-dev
  CONTROL ${control}/triggers ${control}/nothing/postinst ${control}/nothing/postrm)
zarvo_package(zarvo-tools SECTION video NEEDS libzarvo-sdk1
  SUMMARY "programs that record and check a Zarvo capture card"
  TEXT "${card}
These programs record its channels, for seconds or for months as a
service, detect motion, make clips of recordings, and check the card and
its driver."
  SUGGESTS zarvo-virtual-card
  CONTROL ${control}/zarvo-tools/postinst ${control}/zarvo-tools/prerm ${control}/zarvo-tools/postrm)
zarvo_package(zarvo-demo SECTION video NEEDS libzarvo-sdk1 zarvo-virtual-card
  SUMMARY "dialog for watching and recording sixteen cameras"
  TEXT "${card}
The demo application shows its cameras live, records each into one file
an hour, and plays the recordings. Without a card it uses the virtual
card."
  RECOMMENDS "ffmpeg | mpv")

add_custom_command(TARGET zarvo_sdk_static POST_BUILD COMMAND ${CMAKE_STRIP} --strip-debug $<TARGET_FILE:zarvo_sdk_static>)
install(DIRECTORY ${CMAKE_CURRENT_BINARY_DIR}/doxygen/html DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/libzarvo-sdk-dev
        COMPONENT libzarvo-sdk-dev)
install(FILES debian/60-libzarvo-sdk1.rules DESTINATION ${CMAKE_INSTALL_PREFIX}/lib/udev/rules.d COMPONENT libzarvo-sdk1)
include(CPack)
