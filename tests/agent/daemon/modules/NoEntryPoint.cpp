// SPDX-License-Identifier: BSD-2-Clause
// A shared object that is not a board module.
extern "C" __attribute__((visibility("default"))) int kvl_something_else() {
    return 1;
}
