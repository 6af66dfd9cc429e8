# SPDX-License-Identifier: Apache-2.0
# Run by CPack on the installed files before they are packed: what Debian wants otherwise than
# `cmake --install` leaves it.
set(stage ${CPACK_TEMPORARY_DIRECTORY})

# The licence is a file of the system's, which `copyright` names, and the changelog has another name.
file(REMOVE
  ${stage}/development/usr/share/doc/libovrinresize-dev/LICENSE
  ${stage}/development/usr/share/doc/libovrinresize-dev/CHANGELOG.md)

file(GLOB_RECURSE texts
  ${stage}/*/usr/share/man/*.1 ${stage}/*/changelog ${stage}/*/changelog.Debian)
execute_process(COMMAND gzip -9n ${texts} COMMAND_ERROR_IS_FATAL ANY)

# As Debian strips: what is linked at run time of all that it does without, the static library of
# debug information only.
file(GLOB library ${stage}/runtime/usr/lib/*/libovrinresize.so.*.*)
file(GLOB module ${stage}/python/usr/lib/python3/dist-packages/ovrinresize/_native.*.so)
file(GLOB static_library ${stage}/development/usr/lib/*/libovrinresize.a)
execute_process(COMMAND strip --strip-unneeded --remove-section=.comment --remove-section=.note
  ${library} ${module} ${stage}/tool/usr/bin/ovrinresize COMMAND_ERROR_IS_FATAL ANY)
execute_process(COMMAND strip --strip-debug --remove-section=.comment --remove-section=.note
  --enable-deterministic-archives ${static_library} COMMAND_ERROR_IS_FATAL ANY)

# CPack's own search for what the library needs would also give the package scripts that call ldconfig,
# where a trigger is enough. dpkg-shlibdeps wants to see a control file.
file(WRITE ${stage}/runtime/debian/control "")
execute_process(COMMAND dpkg-shlibdeps -O ${library}
  WORKING_DIRECTORY ${stage}/runtime OUTPUT_VARIABLE needed COMMAND_ERROR_IS_FATAL ANY)
file(REMOVE_RECURSE ${stage}/runtime/debian)
string(REGEX REPLACE "^shlibs:Depends=|\n" "" CPACK_DEBIAN_RUNTIME_PACKAGE_DEPENDS "${needed}")
