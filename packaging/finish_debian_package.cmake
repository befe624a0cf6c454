# Run by CPack between installing into its folder and packing that: what Debian wants in a package.

set(root ${CPACK_TEMPORARY_INSTALL_DIRECTORY}${CPACK_PACKAGING_INSTALL_PREFIX})
set(folder ${root}/share/doc/${CPACK_PACKAGE_NAME})

file(STRINGS ${folder}/LICENSE copyright_line REGEX "^Copyright \\(c\\) ")
string(REPLACE "Copyright (c) " "" holder "${copyright_line}")
file(READ ${folder}/LICENSE license)
string(REGEX REPLACE "^.*${holder}\n\n" "" license "${license}")
string(REGEX REPLACE "\n\n" "\n.\n" license "${license}")
string(REGEX REPLACE "\n(.)" "\n \\1" license "${license}")
file(WRITE ${folder}/copyright
"Format: https://www.debian.org/doc/packaging-manuals/copyright-format/1.0/
Upstream-Name: VexelYAMLMerge

Files: *
Copyright: ${holder}
License: Expat
 ${license}")

file(STRINGS ${folder}/CHANGELOG.md heading REGEX "^## ${CPACK_PACKAGE_VERSION} - ")
if(NOT heading)
  message(FATAL_ERROR "CHANGELOG.md has no entry for version ${CPACK_PACKAGE_VERSION}")
endif()
string(REGEX REPLACE "^.* - " "" day "${heading}")
execute_process(COMMAND date --utc --rfc-email --date=${day} OUTPUT_VARIABLE date OUTPUT_STRIP_TRAILING_WHITESPACE
  COMMAND_ERROR_IS_FATAL ANY)
file(WRITE ${folder}/changelog
"${CPACK_PACKAGE_NAME} (${CPACK_PACKAGE_VERSION}) unstable; urgency=medium

  * New release; CHANGELOG.md says what is new.

 -- ${CPACK_PACKAGE_CONTACT}  ${date}
")
execute_process(COMMAND gzip -9n ${folder}/changelog COMMAND_ERROR_IS_FATAL ANY)

# Debian's zsh looks for the completions of packages there.
file(RENAME ${root}/share/zsh/site-functions ${root}/share/zsh/vendor-completions)

# Whatever the umask of who makes the package.
file(CHMOD_RECURSE ${folder} FILE_PERMISSIONS OWNER_READ OWNER_WRITE GROUP_READ WORLD_READ)
file(CHMOD_RECURSE ${root} DIRECTORY_PERMISSIONS
  OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
