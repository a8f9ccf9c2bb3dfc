// SPDX-License-Identifier: BSD-2-Clause
// The bits of which dsx1LineStatus is the sum.
#pragma once

#include "agent/objects/Description.h"

namespace kvloamd {

inline constexpr NamedNumber kLineStatusBits[] = {{1, "dsx1NoAlarm"},
                                                  {2, "dsx1RcvFarEndLOF"},
                                                  {4, "dsx1XmtFarEndLOF"},
                                                  {8, "dsx1RcvAIS"},
                                                  {16, "dsx1XmtAIS"},
                                                  {32, "dsx1LossOfFrame"},
                                                  {64, "dsx1LossOfSignal"},
                                                  {128, "dsx1LoopbackState"},
                                                  {256, "dsx1T16AIS"},
                                                  {512, "dsx1RcvFarEndLOMF"},
                                                  {1024, "dsx1XmtFarEndLOMF"},
                                                  {2048, "dsx1RcvTestCode"},
                                                  {4096, "dsx1OtherFailure"},
                                                  {8192, "dsx1UnavailSigState"},
                                                  {16384, "dsx1NetEquipOOS"},
                                                  {32768, "dsx1RcvPayloadAIS"},
                                                  {65536, "dsx1Ds2PerfThreshold"}};

} // namespace kvloamd
