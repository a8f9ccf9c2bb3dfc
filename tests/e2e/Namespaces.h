// SPDX-License-Identifier: BSD-2-Clause
// Kernel namespaces, in which a test may change mounts and network interfaces.
#pragma once

namespace kvloamd::e2e {

/// Moves this process, and the programs that it starts later, into new namespaces: CLONE_NEWNS,
/// CLONE_NEWNET. Changes there are seen nowhere else. Returns false where the system forbids it.
bool enterNamespaces(int kinds);

} // namespace kvloamd::e2e
