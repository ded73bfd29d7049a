#pragma once
#include <functional>
#include <vector>

namespace AnvilCore {

/// Builds the bundled demo scene into an empty `g_db`: deterministic, the same on every run.
void buildDemoScene();

/// A part of the demo added after the markers (audio, cameras, skeleton...), by order.
using DemoPart = std::function<void()>;
void registerDemoPart(int i_order, DemoPart i_part);

struct DemoPartRegistration {
  DemoPartRegistration(int i_order, DemoPart i_part) {
    registerDemoPart(i_order, std::move(i_part));
  }
};

} // namespace AnvilCore

#define ANVIL_REGISTER_DEMO_PART(order, fn)                                                        \
  static const ::AnvilCore::DemoPartRegistration ANVIL_DEMO_CAT(s_demo_, __LINE__)(order, fn);
#define ANVIL_DEMO_CAT2(a, b) a##b
#define ANVIL_DEMO_CAT(a, b) ANVIL_DEMO_CAT2(a, b)
