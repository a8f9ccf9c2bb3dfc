// SPDX-License-Identifier: BSD-2-Clause
// Identifies the library. Needs none of its classes; also for programs in C.
#pragma once

#include "platform/Export.h"

/// The library's version: a tag, "cid", an eight-digit version, a build number and "OAM".
#define OAM_VERSION_STRING "VQcid 01010000-164 OAM"

#ifdef __cplusplus
extern "C" {
#endif

/// `OAM_VERSION_STRING`, held by the library.
KVLOAM_API char const* OAM_VersionString(void);
/// The notice text, held by the library.
KVLOAM_API char const* OAM_GetCopyRight(void);

#ifdef __cplusplus
}
#endif
