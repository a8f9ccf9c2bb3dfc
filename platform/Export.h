// SPDX-License-Identifier: BSD-2-Clause
// Marks what the library exports; everything else stays hidden.
#pragma once

#define KVLOAM_API __attribute__((visibility("default")))
