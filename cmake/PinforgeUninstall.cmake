# Removes what the last install from a build folder wrote: the files listed in its
# install_manifest*.txt, then the folders that install recorded as created in
# install_folders*.txt, deepest first and only once empty (a file put there since stays, and
# so does its folder). Folders that existed before the install are never removed.
# Usage: cmake -DMANIFEST=<build>/install_manifest.txt -P cmake/PinforgeUninstall.cmake
if(NOT MANIFEST OR NOT EXISTS "${MANIFEST}")
  message(FATAL_ERROR "uninstall: no install manifest at '${MANIFEST}'; run make install first")
endif()
get_filename_component(folder_of_manifest "${MANIFEST}" DIRECTORY)
get_filename_component(manifest_name "${MANIFEST}" NAME)
string(REPLACE "install_manifest" "install_folders" record_name "${manifest_name}")
set(record "${folder_of_manifest}/${record_name}")

file(STRINGS "${MANIFEST}" installed)
foreach(file IN LISTS installed)
  if(IS_SYMLINK "${file}" OR EXISTS "${file}")
    message(STATUS "Removing ${file}")
    file(REMOVE "${file}")
  endif()
endforeach()

if(EXISTS "${record}")
  file(STRINGS "${record}" created)
  # Descending order puts a folder after everything inside it.
  list(SORT created ORDER DESCENDING)
  foreach(folder IN LISTS created)
    if(IS_DIRECTORY "${folder}" AND NOT IS_SYMLINK "${folder}")
      file(GLOB left LIST_DIRECTORIES true "${folder}/*" "${folder}/.*")
      if(NOT left)
        message(STATUS "Removing ${folder}")
        file(REMOVE_RECURSE "${folder}")
      endif()
    endif()
  endforeach()
  file(REMOVE "${record}")
endif()
file(REMOVE "${MANIFEST}")
