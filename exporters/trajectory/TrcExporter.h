#pragma once
#include "plugin/host/FileExporter.h"
#include "plugin/host/TSimpleArray.h"
#include <cstdint>

class Node;

/// The four TRC flags, copied whole by `getOptions` and `setOptions`.
struct TrcExportOptions {
  bool m_writeUnlabelled = true;
  bool m_writeSubjects = false;
  bool m_removeLeadingUnderscores = false;
  bool m_collapseSubjects = false;
};
static_assert(sizeof(TrcExportOptions) == 4);

/// Writes marker trajectories as tab-separated TRC text: four header lines, the column line,
/// then one line per frame of X/Y/Z triples in millimetres.
class TrcExporter : public FileExporter {
public:
  static TrcExporter* createInstance();
  void deleteThis() override { delete this; }

  bool getOptions(void* o_pOptions) override;
  bool setOptions(void* i_pOptions) override;
  int getDataType() override { return 5; }
  HString getDescription() override { return "Motion Analysis Trajectory"; }
  bool recognize(const HString& i_rFilename) override;
  bool hasEditableOptions() override { return true; }
  void loadUserSetup() override;
  void saveUserSetup() const override;
  void reset() override;
  /// Always succeeds: the format has no limit this exporter must check.
  bool write() override;
  /// Hands the four flags to the host's options editor; false when the host has none.
  bool editOptions(void* io_pOptions);

  /// Kept as an option but not used by `write`.
  bool getWriteUnlabelled() const { return m_options.m_writeUnlabelled; }
  void setWriteUnlabelled(bool i_value) { m_options.m_writeUnlabelled = i_value; }
  bool getWriteSubjects() const { return m_options.m_writeSubjects; }
  void setWriteSubjects(bool i_value) { m_options.m_writeSubjects = i_value; }
  bool getRemoveLeadingUnderscores() const { return m_options.m_removeLeadingUnderscores; }
  void setRemoveLeadingUnderscores(bool i_value) { m_options.m_removeLeadingUnderscores = i_value; }
  bool getCollapseSubjects() const { return m_options.m_collapseSubjects; }
  void setCollapseSubjects(bool i_value) { m_options.m_collapseSubjects = i_value; }

  /// Column name of a marker under the current flags.
  HString displayName(const Node* i_pMarker) const;

private:
  TrcExporter();
  void writeHeader();
  void writeFrames();

  TSimpleArray<Node*> m_markers;
  TSimpleArray<Node*> m_extraNodes; // never filled; its columns would follow the markers'
  TrcExportOptions m_options;
};
