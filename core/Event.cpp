// SPDX-License-Identifier: BSD-2-Clause
#include "core/Event.h"

Event::~Event() = default;
