# SPDX-License-Identifier: Apache-2.0
#
# What `cmake --install` puts where, and the Debian package of it (`cpack -G DEB` in the build's directory). Programs look for
# their libraries and plug-ins from where they are themselves (../lib), so the libraries stay in lib whatever a system
# calls its own. The unit names /usr/bin/lumod, and /usr is where this goes unless somebody says otherwise.
if(CMAKE_INSTALL_PREFIX_INITIALIZED_TO_DEFAULT)
  set(CMAKE_INSTALL_PREFIX /usr CACHE PATH "Where to install" FORCE)
endif()

install(TARGETS tovicli lumod orkasim orka-conformance RUNTIME DESTINATION bin)
# Nobody compiles against an installation: it goes without the names that only a linker looks for.
install(TARGETS plexa lumo kestrel LIBRARY DESTINATION lib NAMELINK_SKIP)
install(TARGETS tovicli_cli tovicli_lines LIBRARY DESTINATION lib/tovicli)
install(TARGETS lumointernal LIBRARY DESTINATION lib/tovicli/plugins)
install(DIRECTORY ${CMAKE_BINARY_DIR}/share/man DESTINATION share)
install(FILES apps/lumod/systemd/lumod.service apps/lumod/systemd/lumod.socket DESTINATION lib/systemd/system)

# The shells' completions, where each looks for them, written by the tool that they are for.
foreach(completion bash-completion/completions/tovicli=bash zsh/vendor-completions/_tovicli=zsh
                   fish/vendor_completions.d/tovicli.fish=fish)
  string(REPLACE "=" ";" completion ${completion})
  list(GET completion 0 file)
  list(GET completion 1 shell)
  install(CODE "
    set(file \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/share/${file}\")
    get_filename_component(directory \"\${file}\" DIRECTORY)
    file(MAKE_DIRECTORY \"\${directory}\")
    execute_process(COMMAND $<TARGET_FILE:tovicli> cli completion ${shell} OUTPUT_FILE \"\${file}\" COMMAND_ERROR_IS_FATAL ANY)
    message(STATUS \"Installing: \${file}\")")
endforeach()

set(CPACK_PACKAGE_NAME tovi-lumo)
set(CPACK_PACKAGE_CONTACT "The Lumo developers <lumo@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "Lumo storage commands, daemon and array simulator of a Tovi host")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION admin)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
# What is loaded from ../lib by its place is this package's own.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_LIBRARY_OUTPUT_DIRECTORY})
set(CPACK_DEBIAN_PACKAGE_RECOMMENDS ca-certificates)
set(CPACK_STRIP_FILES ON)
include(CPack)
