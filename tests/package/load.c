/* SPDX-License-Identifier: Apache-2.0 */
/* load LIBRARY NAME...: the dynamic loader finds every name. */
#include <dlfcn.h>
#include <stdio.h>

int main(int argc, char** argv) {
    if (argc < 3) return 2;
    void* library = dlopen(argv[1], RTLD_NOW | RTLD_LOCAL);
    if (library == NULL) {
        printf("%s\n", dlerror());
        return 1;
    }
    for (int i = 2; i < argc; ++i) {
        if (dlsym(library, argv[i]) == NULL) {
            printf("%s\n", dlerror());
            return 1;
        }
    }
    printf("%d names found\n", argc - 2);
    return dlclose(library);
}
