// The scenarios, one list a subject.
#pragma once

#include <span>
#include <vector>

#include "faults/world.h"

namespace faults {

std::span<const Scenario> HandleScenarios();
std::span<const Scenario> StatementScenarios();
std::span<const Scenario> FetchScenarios();
std::span<const Scenario> LobScenarios();
std::span<const Scenario> PackageScenarios();
std::span<const Scenario> LegacyScenarios();
std::span<const Scenario> XaScenarios();

inline std::vector<Scenario> AllScenarios() {
    std::vector<Scenario> all;
    for (const auto& list : {HandleScenarios(), StatementScenarios(), FetchScenarios(), LobScenarios(),
                             PackageScenarios(), LegacyScenarios(), XaScenarios()}) {
        all.insert(all.end(), list.begin(), list.end());
    }
    return all;
}

}  // namespace faults
