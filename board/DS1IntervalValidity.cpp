// SPDX-License-Identifier: BSD-2-Clause
#include "board/DS1IntervalValidity.h"

DS1IntervalValidity::DS1IntervalValidity() = default;

DS1IntervalValidity::~DS1IntervalValidity() = default;
