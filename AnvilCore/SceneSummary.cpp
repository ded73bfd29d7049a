#include "SceneSummary.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/NLEClip.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/SubjectManager.h"
#include "plugin/host/VideoCamera.h"
#include <cstdio>
#include <string>
#include <vector>

namespace AnvilCore {

namespace {
std::string frames(const HTimeRange& i_rRange) {
  const HTimeManager* pTime = g_db->getTimeManager();
  return std::to_string(pTime->getFrame(i_rRange.getStart())) + ".." +
         std::to_string(pTime->getFrame(i_rRange.getEnd())) + " (" +
         std::to_string(i_rRange.getNumFrames()) + " frames)";
}

void nameList(std::ostream& o_rOut, const char* i_pTitle, const std::vector<std::string>& i_names) {
  o_rOut << i_pTitle << ": " << i_names.size();
  if (!i_names.empty()) {
    o_rOut << "\n ";
    for (const std::string& name : i_names)
      o_rOut << ' ' << name;
  }
  o_rOut << '\n';
}
std::string number(double i_value) {
  char text[32];
  std::snprintf(text, sizeof text, "%g", i_value);
  return text;
}

// "; -1.5..20 N, 0..3 V": the range of the true values of each measured channel.
std::string measuredRanges(const AudioSource& i_rAudio) {
  if (!i_rAudio.hasMeasurements()) return "";
  std::string text;
  for (int c = 0; c < i_rAudio.getNumChannels(); ++c) {
    const AnalogChannel& channel = i_rAudio.getMeasurement(c);
    double low = 0.0, high = 0.0;
    for (size_t i = 0; i < channel.readings.size(); ++i) {
      const double value = channel.valueAt(i);
      if (i == 0 || value < low) low = value;
      if (i == 0 || value > high) high = value;
    }
    text += (c == 0 ? "; " : ", ") + number(low) + ".." + number(high);
    if (!channel.units.empty()) text += " " + channel.units;
  }
  return text;
}
} // namespace

void describeScene(std::ostream& o_rOut) {
  const HTimeManager* pTime = g_db->getTimeManager();
  char rate[64];
  std::snprintf(rate, sizeof rate, "%g", pTime->getFrameRate());
  o_rOut << "scene: "
         << (g_db->getSceneName().IsEmpty() ? "(unnamed)" : g_db->getSceneName().GetStr()) << '\n'
         << "frame rate: " << rate << " Hz\n"
         << "animation range: " << frames(pTime->getAnimRange()) << '\n'
         << "play range: " << frames(pTime->getPlayRange()) << '\n'
         << "up axis: " << (g_db->isZUp() ? "Z" : "Y") << '\n';

  std::vector<std::string> labelled, unlabelled;
  for (Module* p : g_db->getModules()) {
    if (!p->isKindOf(&Marker::s_classMarker)) continue;
    const Marker* pMarker = static_cast<const Marker*>(p);
    (pMarker->isUnlabeled() ? unlabelled : labelled).push_back(p->getPartialPathString().GetStr());
  }
  nameList(o_rOut, "labelled markers", labelled);
  nameList(o_rOut, "unlabelled markers", unlabelled);

  std::vector<std::string> subjects;
  const SubjectManager* pSubjects = g_db->getSubjectManager();
  for (int i = 0; i < pSubjects->getNumSubjects(); ++i) {
    const Character* pSubject = pSubjects->getSubject(i);
    subjects.push_back(std::string(pSubject->getName().GetStr()) +
                       (pSubject->isProp() ? " (prop)" : ""));
  }
  nameList(o_rOut, "subjects", subjects);

  std::vector<std::string> optical, video;
  for (int i = 0; i < g_db->getNumOpticalCameras(); ++i) {
    const OpticalCamera* pCamera = g_db->getOpticalCamera(i);
    optical.push_back(std::string("#").append(std::to_string(pCamera->getCameraNumber())) + " \"" +
                      pCamera->getName().GetString() + "\"" +
                      (pCamera->isCalibrated() ? "" : " (uncalibrated)"));
  }
  for (Module* p : g_db->getModules())
    if (p->isKindOf(&VideoCamera::s_classVideoCamera)) video.push_back(p->getName().GetString());
  nameList(o_rOut, "optical cameras", optical);
  nameList(o_rOut, "video cameras", video);

  std::vector<std::string> audio;
  for (Module* p : g_db->getModules()) {
    if (!p->isKindOf(&AudioSource::s_classAudioSource)) continue;
    const AudioSource* pAudio = static_cast<const AudioSource*>(p);
    audio.push_back(
        "\"" + p->getName().GetString() + "\" (" + std::to_string(pAudio->getNumChannels()) +
        " ch, " + number(pAudio->getSampleRate()) + " Hz, " +
        std::to_string(pAudio->getNumSamples()) + " samples" + measuredRanges(*pAudio) + ")");
  }
  nameList(o_rOut, "audio sources", audio);

  std::vector<std::string> clips;
  for (const NLEClip* pClip = g_db->getHeadClip(); pClip; pClip = pClip->getNext())
    clips.push_back("\"" + pClip->getName().GetString() + "\" " + frames(pClip->getRange()) +
                    (pClip == g_db->getActiveClip() ? " (active)" : ""));
  nameList(o_rOut, "clips", clips);
}

} // namespace AnvilCore
