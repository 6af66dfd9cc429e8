# SPDX-License-Identifier: Apache-2.0
# Warnings for all of our own targets: target_link_libraries(t PRIVATE ovrinresize_warnings).
add_library(ovrinresize_warnings INTERFACE)
target_compile_options(ovrinresize_warnings INTERFACE
  -Wall -Wextra -Wconversion -Wshadow -Wpedantic
  $<$<BOOL:${OVRINRESIZE_WERROR}>:-Werror>)
