// The demo's sound and clip: a stereo 48 kHz source (footstep clicks left, a hum right) over
// the animation range, and one active clip starting at timecode 01:00:00:00.
#include "DemoScene.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/NLEClip.h"
#include <cmath>

namespace AnvilCore {
namespace {
constexpr int kSampleRate = 48000;
constexpr double kPi = 3.14159265358979323846;
constexpr double kFirstStep = 0.3;   // seconds
constexpr double kStepPeriod = 0.55; // seconds between footfalls
constexpr double kClickHz = 1200.0;
constexpr double kClickDecay = 0.012; // seconds for the click to fall by e
constexpr double kHumHz = 220.0;

void addAudioAndClip() {
  HTimeManager* pTime = g_db->getTimeManager();
  const HTimeRange range = pTime->getAnimRange();
  const double seconds =
      double(range.getEnd() - range.getStart() + pTime->getTicksPerFrame()) / kTicksPerSecond;
  const size_t count = size_t(std::lround(seconds * kSampleRate));

  std::vector<int16_t> steps(count), hum(count);
  for (size_t i = 0; i < count; ++i) {
    const double t = double(i) / kSampleRate;
    double click = 0.0;
    if (t >= kFirstStep) {
      const double since = std::fmod(t - kFirstStep, kStepPeriod);
      click = 12000.0 * std::exp(-since / kClickDecay) * std::sin(2.0 * kPi * kClickHz * since);
    }
    const double fadeIn = std::min(1.0, t / 0.5);
    steps[i] = int16_t(std::lround(click));
    hum[i] = int16_t(std::lround(3000.0 * fadeIn * std::sin(2.0 * kPi * kHumHz * t)));
  }
  auto* pSource = new AudioSource("Room");
  pSource->setSamples(kSampleRate, {std::move(steps), std::move(hum)});
  pSource->setStartTime(range.getStart());
  g_db->addToScene(pSource, false, nullptr, false, false);

  pTime->setTimecodeMode(ETimecodeMode30Hz);
  auto* pClip = new NLEClip("Walk", range);
  pClip->setStartOffset(pTime->timecodeToTime(1, 0, 0, 0) - range.getStart());
  g_db->addClip(pClip);
  g_db->setActiveClip(pClip, false, false, false);
}
} // namespace

ANVIL_REGISTER_DEMO_PART(30, addAudioAndClip)

} // namespace AnvilCore
