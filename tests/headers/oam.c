/* SPDX-License-Identifier: BSD-2-Clause */
/* A program in C can identify the library. */
#include "services/oam.h"

char const* versionOfTheHeader(void);
char const* versionOfTheLibrary(void);
char const* notice(void);

char const* versionOfTheHeader(void) {
    return OAM_VERSION_STRING;
}

char const* versionOfTheLibrary(void) {
    return OAM_VersionString();
}

char const* notice(void) {
    return OAM_GetCopyRight();
}
