// The parameter section of a C3D export: labels, subjects, analog channels, timecode, axes.
#include "C3DExporter.h"
#include "c3d/C3DParameterSection.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/NLEClip.h"
#include <algorithm>
#include <cstdio>

namespace {
enum EGroup {
  EGroupPoint = 1,
  EGroupSubjects = 2,
  EGroupAnalog = 3,
  EGroupTimecode = 4,
  EGroupTrial = 5
};

// The count of blocks announced in the section's third byte. It is not the real size: the
// records follow it and readers walk them to the end.
constexpr uint8_t kAnnouncedBlocks = 8;
constexpr int kMarkersPerLabelChunk = 255;
constexpr int kLabelWidth = 64;
const char* const kUnitTexts[] = {"mm  ", "cm  ", "in  ", "m   "};
const char* const kStandardTexts[] = {"FILM", "FILM", "PAL", "NTSC", "NTSC", "NTSC"};

std::string withoutLeadingUnderscore(const HString& i_rText) {
  const std::string& text = i_rText.GetString();
  return (!text.empty() && text[0] == '_') ? text.substr(1) : text;
}
} // namespace

HString C3DExporter::labelOf(const Marker* i_pMarker) {
  HString label;
  if (m_options.m_writeUnlabelled && i_pMarker->isUnlabeled()) {
    label = i_pMarker->getName();
    if (!label.IsEmpty()) label[0] = '*';
  } else if (m_options.m_collapseToSubjects && i_pMarker->getCharacterParent()) {
    label = i_pMarker->getPartialPathString();
    label.Replace("\\", ":");
    if (m_options.m_removeLeadingUnderscores) label = withoutLeadingUnderscore(label);
  } else {
    label = i_pMarker->getName();
  }
  if (label.IsEmpty()) label = "NamelessMarker";

  const int colon = label.ReverseFind(':');
  if (colon >= 0) {
    const HString subject = label.Left(colon);
    bool known = false;
    for (const HString& name : m_subjectNames)
      known = known || name == subject;
    if (!known) m_subjectNames.add(subject);
  }
  return label;
}

void C3DExporter::writeParameterSection() {
  C3D::VParameterSection section(m_options.m_decFormat, kAnnouncedBlocks);
  addPointGroup(section);
  addSubjectsGroup(section);
  addAnalogGroup(section);
  addTimecodeGroup(section);
  addTrialGroup(section);
  section.finish();

  const std::vector<uint8_t>& bytes = section.bytes();
  std::fseek(m_pFile, C3D::kBlockSize, SEEK_SET);
  std::fwrite(bytes.data(), 1, bytes.size(), m_pFile);
  // A section ending exactly on a block boundary leaves one unused block before the data.
  const long end = C3D::kBlockSize + long(bytes.size());
  m_dataStartBlock = int(end / C3D::kBlockSize + 2);

  uint8_t word[2];
  C3D::putU16LE(word, uint16_t(m_dataStartBlock));
  std::fseek(m_pFile, m_dataStartOffset, SEEK_SET);
  std::fwrite(word, 1, 2, m_pFile);
}

void C3DExporter::addPointGroup(C3D::VParameterSection& io_rSection) {
  io_rSection.addGroup(EGroupPoint, "POINT");
  io_rSection.addInt(EGroupPoint, "USED", m_pointCount);
  io_rSection.addFloat(EGroupPoint, "SCALE", m_scale);
  io_rSection.addFloat(EGroupPoint, "RATE", m_frameRate);
  // Patched once the section's size is known.
  m_dataStartOffset = C3D::kBlockSize + int(io_rSection.addInt(EGroupPoint, "DATA_START", 0));
  io_rSection.addInt(EGroupPoint, "FRAMES", m_lastFrame - m_firstFrame + 1);

  // 255 labels per chunk; a count that is a multiple of 255 ends with an empty chunk.
  const int chunks = m_pointCount / kMarkersPerLabelChunk + 1;
  for (int chunk = 0; chunk < chunks; ++chunk) {
    const int first = chunk * kMarkersPerLabelChunk;
    const int last = std::min(first + kMarkersPerLabelChunk - 1, m_pointCount - 1);
    std::string text;
    for (int i = first; i <= last; ++i)
      C3D::appendPadded(text, labelOf(m_markers[i]).GetString(), kLabelWidth);
    char name[32] = "LABELS";
    if (chunk > 0) std::snprintf(name, sizeof name, "LABELS%d", chunk + 1);
    io_rSection.addText(EGroupPoint, name, {kLabelWidth, (last - first + 1) & 0xFF}, text);
  }

  const int units = (m_units >= 0 && m_units < 4) ? m_units : 0;
  io_rSection.addText(EGroupPoint, "UNITS", {4}, kUnitTexts[units]);

  if (m_firstFrame > 0xFFFE || m_lastFrame > 0xFFFE) {
    // The frame numbers as 32-bit integers under the float type byte, as readers expect them.
    for (const auto& [pName, frame] :
         {std::pair{"DRU_FIRST_FRAME", m_firstFrame}, std::pair{"DRU_LAST_FRAME", m_lastFrame}}) {
      uint8_t data[4];
      for (int b = 0; b < 4; ++b)
        data[b] = uint8_t(uint32_t(frame) >> (8 * b));
      io_rSection.addParameter(EGroupPoint, pName, C3D::ETypeFloat, {}, data, 4);
    }
  }
}

void C3DExporter::addSubjectsGroup(C3D::VParameterSection& io_rSection) {
  const int count = m_subjectNames.getCount();
  int width = 0;
  for (const HString& name : m_subjectNames)
    width = std::max(width, name.GetLength());

  std::string names, prefixes;
  for (const HString& name : m_subjectNames) {
    const std::string text =
        m_options.m_removeLeadingUnderscores ? withoutLeadingUnderscore(name) : name.GetString();
    C3D::appendPadded(names, text, width);
    C3D::appendPadded(prefixes, text + ":", width + 1);
  }
  io_rSection.addGroup(EGroupSubjects, "SUBJECTS");
  io_rSection.addInt(EGroupSubjects, "IS_STATIC", 0);
  io_rSection.addInt(EGroupSubjects, "USES_PREFIXES", 1);
  io_rSection.addInt(EGroupSubjects, "USED", count);
  io_rSection.addText(EGroupSubjects, "NAMES", {width, count}, names);
  io_rSection.addText(EGroupSubjects, "LABEL_PREFIXES", {width + 1, count}, prefixes);
}

void C3DExporter::addAnalogGroup(C3D::VParameterSection& io_rSection) {
  io_rSection.addGroup(EGroupAnalog, "ANALOG");
  io_rSection.addInt(EGroupAnalog, "USED", m_analogChannels);
  if (m_audioSources.isEmpty()) return;

  // Name lengths go through a signed byte, as the dimension that holds them.
  int width = 0;
  for (const AudioSource* pSource : m_audioSources)
    width = std::max(width, int(int8_t(pSource->getName().GetLength())));
  const int descriptionWidth = std::max(32, width);
  const int channels = m_analogChannels;

  std::string labels, descriptions;
  for (const AudioSource* pSource : m_audioSources)
    for (int c = 0; c < pSource->getNumChannels(); ++c) {
      C3D::appendPadded(labels, pSource->getName().GetString(), width);
      C3D::appendPadded(descriptions, "Audio", descriptionWidth);
    }
  io_rSection.addText(EGroupAnalog, "LABELS", {width, channels}, labels);
  io_rSection.addText(EGroupAnalog, "DESCRIPTIONS", {descriptionWidth, channels}, descriptions);
  io_rSection.addFloat(EGroupAnalog, "GEN_SCALE", 1.0f);
  io_rSection.addFloats(EGroupAnalog, "SCALE", {channels},
                        std::vector<float>(size_t(channels), 1.0f));
  io_rSection.addInts(EGroupAnalog, "OFFSET", {channels},
                      std::vector<int>(size_t(channels), -32768));
  io_rSection.addFloat(EGroupAnalog, "RATE", float(m_analogRate));
}

void C3DExporter::addTimecodeGroup(C3D::VParameterSection& io_rSection) {
  const NLEClip* pClip = g_db->getActiveClip();
  const HTimeManager* pTime = HTimeManager::getInstance();
  if (!m_options.m_writeTimeCode || !pClip || !pTime->isTimecodeSupported()) return;
  const ZMT::ITimecode<135000000> tc = pTime->getTimecode(pClip->getStartTime());
  if (!tc.isValid()) return;

  const int64_t ticksPerFrame = ZMT::ITimecode<135000000>::ticksPerFrame(tc.m_standard);
  // A unit that does not divide the frame and the offset leaves one subframe and no offset.
  int subframesPerFrame = 1, offset = 0;
  if (tc.m_subframeUnit != 0 && ticksPerFrame % tc.m_subframeUnit == 0 &&
      tc.m_subframes % tc.m_subframeUnit == 0) {
    subframesPerFrame = int(ticksPerFrame / tc.m_subframeUnit);
    offset = int(tc.m_subframes / tc.m_subframeUnit);
  }
  const std::string standard = kStandardTexts[tc.m_standard];

  io_rSection.addGroup(EGroupTimecode, "TIMECODE");
  io_rSection.addByte(EGroupTimecode, "DROP_FRAMES",
                      pTime->getTimecodeMode() == ETimecodeModeNtscDrop ? 1 : 0);
  io_rSection.addInt(EGroupTimecode, "USED", 1);
  io_rSection.addInts(EGroupTimecode, "FIELD_NUMBERS", {2, 1}, {0, 0});
  io_rSection.addText(EGroupTimecode, "STANDARD", {int(standard.size())}, standard);
  io_rSection.addInts(EGroupTimecode, "SUBFRAMESPERFRAME", {1, 1}, {subframesPerFrame});
  io_rSection.addInts(EGroupTimecode, "OFFSETS", {1, 1}, {offset});
  io_rSection.addInts(EGroupTimecode, "TIMECODES", {4, 1},
                      {tc.m_hours, tc.m_minutes, tc.m_seconds, tc.m_frames});
}

void C3DExporter::addTrialGroup(C3D::VParameterSection& io_rSection) {
  // Direction codes of the file's axes; they follow the scene's up axis as it is now.
  const bool zUp = g_db->isZUp();
  io_rSection.addGroup(EGroupTrial, "TRIAL");
  io_rSection.addInt(EGroupTrial, "X_DIRECTION", zUp ? 1 : 4);
  io_rSection.addInt(EGroupTrial, "Y_DIRECTION", zUp ? 3 : 5);
  io_rSection.addInt(EGroupTrial, "Z_DIRECTION", zUp ? 5 : 1);
}
