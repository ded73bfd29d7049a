// A key light above the walkway, turning slowly across the take so that the light road of the
// scene exporters carries animation.
#include "DemoScene.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Light.h"

namespace AnvilCore {
namespace {

void addLight() {
  auto* pLight = new Light("KeyLight");
  pLight->setColor(Vec3(1.0, 0.95, 0.85));
  pLight->setIntensity(1.5);
  // Four metres up at one end of the walk, pointing down (local -Z is world -Z).
  pLight->setStaticTransform(Vec3(0.0, -3000.0, 4000.0), AnvilRotation(), Vec3(1.0, 1.0, 1.0));
  HTimeManager* pTime = g_db->getTimeManager();
  const int64_t tpf = pTime->getTicksPerFrame();
  const int frames = pTime->getAnimRange().getNumFrames();
  for (int frame = 0; frame < frames; frame += 10) {
    const double degrees = 30.0 * frame / double(frames);
    pLight->m_rotationTrack.setKey(frame * tpf, AnvilRotation(Vec3(1.0, 0.0, 0.0), degrees));
  }
  g_db->addToScene(pLight, false, nullptr, false, false);
}

} // namespace

ANVIL_REGISTER_DEMO_PART(50, addLight)

} // namespace AnvilCore
