# What `make install` puts under the prefix: the program and its script shell, the template
# library, the documentation, the man page and bash completion. Every rule is in component
# "pinforge", so a test can install into a scratch prefix with its own manifest.
# Besides install_manifest*.txt, the install records in install_folders*.txt the folders it
# had to create, so that `make uninstall` (cmake/PinforgeUninstall.cmake) removes exactly
# what was installed: those files, then those folders once empty.
include(GNUInstallDirs)

set(PINFORGE_INSTALL_FOLDERS
  ${CMAKE_INSTALL_BINDIR}
  ${CMAKE_INSTALL_DATADIR}/pinforge/templates
  ${CMAKE_INSTALL_DOCDIR}
  ${CMAKE_INSTALL_MANDIR}/man1
  ${CMAKE_INSTALL_DATADIR}/bash-completion/completions)

# Runs before anything is copied: which of the destination folders and their parents exist
# already.
install(CODE "set(PINFORGE_FOLDERS \"${PINFORGE_INSTALL_FOLDERS}\")" COMPONENT pinforge)
install(CODE [[
  set(pinforge_root "$ENV{DESTDIR}${CMAKE_INSTALL_PREFIX}")
  set(pinforge_existing "")
  foreach(folder IN LISTS PINFORGE_FOLDERS)
    if(NOT IS_ABSOLUTE "${folder}")
      set(folder "${pinforge_root}/${folder}")
    endif()
    # Up to the root: a prefix that does not exist yet is created by the install too.
    cmake_path(SET folder NORMALIZE "${folder}")
    string(REGEX REPLACE "(.)/+$" "\\1" folder "${folder}")
    set(parent "")
    while(NOT folder STREQUAL parent)
      if(IS_DIRECTORY "${folder}")
        list(APPEND pinforge_existing "${folder}")
      endif()
      set(parent "${folder}")
      get_filename_component(folder "${folder}" DIRECTORY)
    endwhile()
  endforeach()
]] COMPONENT pinforge)

install(TARGETS pinforge RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT pinforge)
install(PROGRAMS tools/runscr DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT pinforge)
# The program looks for templates in ../share/pinforge/templates next to its own folder.
install(DIRECTORY templates/ DESTINATION ${CMAKE_INSTALL_DATADIR}/pinforge/templates
        COMPONENT pinforge)
install(FILES README.md DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT pinforge)
install(DIRECTORY docs/ DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT pinforge
        PATTERN "pinforge.1" EXCLUDE)
install(FILES docs/pinforge.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1 COMPONENT pinforge)
install(FILES tools/pinforge-completion.bash
        DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions RENAME pinforge
        COMPONENT pinforge)

# Runs after everything is copied: every folder above an installed file that did not exist
# before is ours. An earlier install's record is kept, so installing twice
# still uninstalls cleanly.
install(CODE "set(PINFORGE_BUILD_DIR \"${CMAKE_BINARY_DIR}\")" COMPONENT pinforge)
install(CODE [[
  if(CMAKE_INSTALL_COMPONENT)
    set(record "${PINFORGE_BUILD_DIR}/install_folders_${CMAKE_INSTALL_COMPONENT}.txt")
  else()
    set(record "${PINFORGE_BUILD_DIR}/install_folders.txt")
  endif()
  set(created "")
  if(EXISTS "${record}")
    file(STRINGS "${record}" created)
  endif()
  foreach(file IN LISTS CMAKE_INSTALL_MANIFEST_FILES)
    get_filename_component(folder "${file}" DIRECTORY)
    cmake_path(SET folder NORMALIZE "${folder}")
    set(parent "")
    while(NOT folder STREQUAL parent)
      list(FIND pinforge_existing "${folder}" existed)
      if(existed EQUAL -1)
        list(APPEND created "${folder}")
      endif()
      set(parent "${folder}")
      get_filename_component(folder "${folder}" DIRECTORY)
    endwhile()
  endforeach()
  list(REMOVE_DUPLICATES created)
  string(REPLACE ";" "\n" created "${created}")
  file(WRITE "${record}" "${created}\n")
]] COMPONENT pinforge)
