#pragma once
#include "plugin/host/FileExporter.h"
#include "plugin/host/HString.h"
#include "plugin/host/TSimpleArray.h"
#include <cstdint>

class AudioSource;
class Marker;
namespace C3D {
class VParameterSection;
}

/// The C3D options, copied whole by `getOptions` and `setOptions`.
struct C3dExportOptions {
  /// Axis that points up in the file: the scene's own, Y or Z.
  enum EUpAxis : int32_t { EUpAxisScene = 0, EUpAxisY = 1, EUpAxisZ = 2 };

  EUpAxis m_desiredUpAxis = EUpAxisScene;
  bool m_decFormat = true;          ///< floats and the processor byte in DEC form
  bool m_collapseToSubjects = true; ///< labels of subject markers take the subject path
  bool m_preserveGaps = true;       ///< a frame without a key is written as a gap
  bool m_realFormat = true;         ///< floats instead of scaled 16-bit integers
  bool m_writeTimeCode = true;      ///< write the TIMECODE group
  bool m_writeUnlabelled = true;    ///< unlabelled markers get a leading "*"
  bool m_removeLeadingUnderscores = false;
  bool m_filterMinKeys = false; ///< drop markers with fewer keys than `m_minKeys`
  bool m_filterMaxKeys = false; ///< drop markers with more keys than `m_maxKeys`
  int32_t m_minKeys = -1;
  int32_t m_maxKeys = 2147483647;
  bool m_overrideHeaderRate = false; ///< write `m_headerRate` instead of the scene's rate
  double m_headerRate = 0.0;
};

/// Writes the markers and audio sources of an export as a C3D file: parameter section (POINT,
/// SUBJECTS, ANALOG, TIMECODE, TRIAL), then the 512-byte header, then one record per frame of
/// the range, in float or scaled-integer form, floats in DEC or Intel byte order.
///
/// For an up axis other than the scene's, the whole scene is rotated about X for the time of
/// `write` and rotated back at its end.
class C3DExporter : public FileExporter {
public:
  using EUpAxis = C3dExportOptions::EUpAxis;

  static C3DExporter* createInstance();
  void deleteThis() override { delete this; }

  bool getOptions(void* o_pOptions) override;
  bool setOptions(void* i_pOptions) override;
  int getDataType() override { return 21; }
  HString getDescription() override { return "Binary Motion File"; }
  bool recognize(const HString& i_rFilename) override;
  bool hasEditableOptions() override { return true; }
  /// Reads the options from section "C3DExporter"; an absent key keeps the current value. The
  /// DEC flag is not stored.
  void loadUserSetup() override;
  void saveUserSetup() const override;
  /// Forgets the subject names, markers and audio sources of the last `write`.
  void reset() override;
  /// Exports the module list over the time range. False, with nothing logged, for an empty
  /// module list or no stream; false with a logged error for an override rate outside (0, 10000) or
  /// a range starting before frame 0 (the scene then stays rotated).
  bool write() override;

  bool getPreserveGaps() const { return m_options.m_preserveGaps; }
  void setPreserveGaps(bool i_value) { m_options.m_preserveGaps = i_value; }
  bool getCollapseToSubjects() const { return m_options.m_collapseToSubjects; }
  void setCollapseToSubjects(bool i_value) { m_options.m_collapseToSubjects = i_value; }
  bool getRealFormat() const { return m_options.m_realFormat; }
  void setRealFormat(bool i_value) { m_options.m_realFormat = i_value; }
  bool getWriteTimeCode() const { return m_options.m_writeTimeCode; }
  void setWriteTimeCode(bool i_value) { m_options.m_writeTimeCode = i_value; }
  bool getWriteUnlabelled() const { return m_options.m_writeUnlabelled; }
  void setWriteUnlabelled(bool i_value) { m_options.m_writeUnlabelled = i_value; }
  bool getRemoveLeadingUnderscores() const { return m_options.m_removeLeadingUnderscores; }
  void setRemoveLeadingUnderscores(bool i_value) { m_options.m_removeLeadingUnderscores = i_value; }
  bool getDecFormat() const { return m_options.m_decFormat; }
  void setDecFormat(bool i_value) { m_options.m_decFormat = i_value; }
  bool getFilterMinKeys() const { return m_options.m_filterMinKeys; }
  void setFilterMinKeys(bool i_value) { m_options.m_filterMinKeys = i_value; }
  bool getFilterMaxKeys() const { return m_options.m_filterMaxKeys; }
  void setFilterMaxKeys(bool i_value) { m_options.m_filterMaxKeys = i_value; }
  /// Key limits, inclusive. Not checked here: a negative minimum lets every marker pass.
  int getMinKeys() const { return m_options.m_minKeys; }
  void setMinKeys(int i_value) { m_options.m_minKeys = i_value; }
  int getMaxKeys() const { return m_options.m_maxKeys; }
  void setMaxKeys(int i_value) { m_options.m_maxKeys = i_value; }
  bool getOverrideHeaderRate() const { return m_options.m_overrideHeaderRate; }
  void setOverrideHeaderRate(bool i_value) { m_options.m_overrideHeaderRate = i_value; }
  /// Frames per second written when overriding; stored unchecked, validated by `write`.
  double getHeaderRate() const { return m_options.m_headerRate; }
  void setHeaderRate(double i_value) { m_options.m_headerRate = i_value; }
  EUpAxis getDesiredUpAxis() const { return m_options.m_desiredUpAxis; }
  void setDesiredUpAxis(EUpAxis i_axis) { m_options.m_desiredUpAxis = i_axis; }
  /// Accepts "scene", "y" or "z" in any case; false, keeping the axis, for anything else.
  bool setDesiredUpAxis(const HString& i_rAxis);
  /// An integer would silently become a null string; pass an `EUpAxis` instead.
  void setDesiredUpAxis(int) = delete;
  /// "Scene", "Y", "Z", or an empty string for another value.
  HString getDesiredUpAxisAsString() const;

  /// The four DEC bytes of a float: IEEE bytes b0..b3 become b2, b3 + 1, b0, b1 (zero stays
  /// zero). `o_pBytes` receives 4 bytes.
  static void convertFloatToDec(float i_value, char* o_pBytes);
  /// A word as its low and high byte: DEC integers keep the little-endian order.
  static void convertWordToDec(short i_value, char* o_pBytes);
  static void convertUnsignedWordToDec(unsigned short i_value, char* o_pBytes);

  /// What the last `write` computed, for the host and tests.
  int getPointCount() const { return m_pointCount; }
  int getFirstFrame() const { return m_firstFrame; }
  int getLastFrame() const { return m_lastFrame; }
  float getScale() const { return m_scale; }
  int getDataStartBlock() const { return m_dataStartBlock; }
  int getSamplesPerFrame() const { return m_samplesPerFrame; }
  /// The highest sample rate of the audio sources, as they give it (not rounded).
  double getAnalogRate() const { return m_analogRate; }
  int getAnalogChannels() const { return m_analogChannels; }
  const TArray<HString>& getSubjectNames() const { return m_subjectNames; }

private:
  C3DExporter();
  void rotateToDesiredAxis(bool i_wasZUp, bool i_undo);
  void collectMarkers();
  void computeAnalogFigures();
  /// The truncation of a rate over the frame rate (in float, as the file's figures are), taken
  /// as the nearest whole number when within float rounding of it.
  static int wholeRatio(double i_numerator, float i_frameRate);
  void computeScale();
  /// The label of a marker under the current options; adds its subject prefix to the names.
  HString labelOf(const Marker* i_pMarker);

  // The file, in writing order (C3DExporterParameters.cpp, C3DExporterFrames.cpp).
  void writeParameterSection();
  void addPointGroup(C3D::VParameterSection& io_rSection);
  void addSubjectsGroup(C3D::VParameterSection& io_rSection);
  void addAnalogGroup(C3D::VParameterSection& io_rSection);
  void addTimecodeGroup(C3D::VParameterSection& io_rSection);
  void addTrialGroup(C3D::VParameterSection& io_rSection);
  void writeHeader();
  void writeFrames();

  C3dExportOptions m_options;

  int m_pointCount = 0;
  int m_firstFrame = 0;
  int m_lastFrame = 0;
  float m_scale = -1.0f;
  int m_dataStartBlock = 0;
  float m_frameRate = 0.0f;
  int m_units = 0; ///< 0 mm, 1 cm, 2 in, 3 m; nothing sets it
  int64_t m_rangeStart = 0;
  TSimpleArray<AudioSource*> m_audioSources;
  int m_samplesPerFrame = 0;
  double m_analogRate = 0.0;
  int m_analogChannels = 0;
  TArray<HString> m_subjectNames;
  TSimpleArray<const Marker*> m_markers;
  int m_dataStartOffset = 0; ///< file position of the value of POINT:DATA_START
};
