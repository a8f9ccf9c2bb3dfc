// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimEthernet.h"

#include <utility>

Z7SimEthernet::Z7SimEthernet(std::string description) : m_description(std::move(description)) {}

Z7SimEthernet::~Z7SimEthernet() = default;

int Z7SimEthernet::GetDescription(std::string& description) {
    description = m_description;
    return 0;
}
