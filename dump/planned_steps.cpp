#include "dump/planned_steps.h"

#include <array>
#include <bit>
#include <cstdio>
#include <utility>

#include "platform/platform.h"

namespace zal {

std::string flagsNotSet(CollectionFlags anyOf) {
  std::string flags;
  for (; anyOf != 0; anyOf &= anyOf - 1) {
    std::array<char, 16> text{};
    std::snprintf(text.data(), text.size(), "0x%x", 1U << static_cast<unsigned>(std::countr_zero(anyOf)));
    flags.append(flags.empty() ? "" : " or ").append(text.data());
  }
  return "flag " + flags + " is not set";
}

std::vector<std::string> wantedNames(const std::vector<PlannedStep>& steps) {
  std::vector<std::string> names;
  for (const PlannedStep& step : steps) {
    if (step.isWanted) names.push_back(step.name);
  }
  return names;
}

std::shared_ptr<CollectionRecord> beginRecord(Platform& platform, GatheringWitnesses& witnesses,
                                              CollectionRecord::Plan plan) {
  DumpPlan wanted{.service = plan.service, .directory = plan.directory, .steps = wantedNames(plan.steps)};
  const std::string directory = plan.directory;
  auto record = std::make_shared<CollectionRecord>(std::move(plan), platform.clock,
                                                   platform.dumpProgress.begin(std::move(wanted)));
  witnesses.add(directory, record);
  return record;
}

}  // namespace zal
