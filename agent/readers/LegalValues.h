// SPDX-License-Identifier: BSD-2-Clause
// Which numbers the standard MIB modules allow for what boards say of lines and channels.
#pragma once

#include <optional>

namespace kvloamd {

/// The numbers from `lowest` to `highest`, but not `except`.
struct LegalValues {
    int lowest;
    int highest;
    int except = 0;
};

// DS1-MIB.
inline constexpr LegalValues kLineTypes{1, 16, 15};
inline constexpr LegalValues kLineCodings{1, 7};
inline constexpr LegalValues kSendCodes{1, 8};
inline constexpr LegalValues kLoopbackConfigs{1, 6};
inline constexpr LegalValues kLineStatuses{1, 131071};
inline constexpr LegalValues kSignalModes{1, 5};
inline constexpr LegalValues kTransmitClockSources{1, 4};
inline constexpr LegalValues kFdls{1, 15};
inline constexpr LegalValues kLineLengths{0, 64000};
inline constexpr LegalValues kTrapEnables{1, 2};
inline constexpr LegalValues kLoopbackStatuses{1, 127};
inline constexpr LegalValues kDs1ChannelNumbers{0, 28};
inline constexpr LegalValues kChannelizations{1, 3};
inline constexpr LegalValues kLineModes{1, 2};
inline constexpr LegalValues kLineBuildOuts{1, 5};
inline constexpr LegalValues kLineImpedances{1, 4};

// DS0-MIB.
inline constexpr LegalValues kDs0ChannelNumbers{0, 31};

// ISDN-MIB.
inline constexpr LegalValues kBearerTypes{1, 2};
inline constexpr LegalValues kBearerStatuses{1, 4};
inline constexpr LegalValues kBearerNumbers{1, 30};
inline constexpr LegalValues kSignalingProtocols{1, 25};
inline constexpr LegalValues kBearerCounts{1, 65535};
inline constexpr LegalValues kLapdStatuses{1, 3};
inline constexpr LegalValues kCallOrigins{1, 4};
inline constexpr LegalValues kInformationTypes{1, 9};
inline constexpr LegalValues kTruthValues{1, 2};

/// `answer` if it is among `values`. A board that answers another number, or says that it does not
/// know, gives the object no value.
inline std::optional<int> legal(LegalValues const& values, int answer) {
    if (answer < values.lowest || answer > values.highest) return std::nullopt;
    if (values.except != 0 && answer == values.except) return std::nullopt;
    return answer;
}

} // namespace kvloamd
