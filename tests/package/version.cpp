// SPDX-License-Identifier: Apache-2.0
// The header's version is the project's, which the compiler's command line names.
#include <ovrinresize.h>

#include <string_view>

#define TEXT_OF(number) #number
#define TEXT(number) TEXT_OF(number)

static_assert(std::string_view(OVRINRESIZE_VERSION) == PROJECT_VERSION);
static_assert(std::string_view(TEXT(OVRINRESIZE_VERSION_MAJOR) "." TEXT(
                  OVRINRESIZE_VERSION_MINOR) "." TEXT(OVRINRESIZE_VERSION_PATCH)) ==
              OVRINRESIZE_VERSION);
