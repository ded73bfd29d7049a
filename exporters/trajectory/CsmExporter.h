#pragma once
#include "plugin/host/FileExporter.h"
#include <cstdint>

/// The up axis a CSM file is written in.
enum EUpAxis : std::int32_t { EUpAxisY = 0, EUpAxisZ = 1 };

/// The CSM options, copied whole by `getOptions` and `setOptions`.
struct CSMExportOptions {
  std::int32_t m_desiredUpAxis = EUpAxisY; ///< an `EUpAxis`
};

/// Writes the marker positions of the play range as a Character Studio motion file: "$" header
/// keywords, the marker order, then one line per frame of X Y Z triples in millimetres. Has no
/// failure path: `write` always returns true and logs nothing.
class CsmExporter : public FileExporter {
public:
  static CsmExporter* createInstance();
  void deleteThis() override { delete this; }

  bool getOptions(void* o_pOptions) override;
  bool setOptions(void* i_pOptions) override;
  int getDataType() override { return 5; }
  HString getDescription() override { return "Character Studio Motion"; }
  bool recognize(const HString& i_rFilename) override;
  void loadUserSetup() override;
  void saveUserSetup() const override;
  /// Nothing is gathered between exports.
  void reset() override {}
  /// Replaces the base's time range by the play range and writes from that.
  bool write() override;

  /// "Y", "Z", or an empty string for a value outside `EUpAxis`.
  HString getDesiredUpAxisAsString() const;
  /// Accepts "y" or "z" in any case; false, leaving the option alone, for any other text.
  bool setDesiredUpAxis(HString i_axis);
  std::int32_t getDesiredUpAxis() const { return m_options.m_desiredUpAxis; }

  /// The text behind the last backslash of a path, the whole path when it has none. The first
  /// character is never taken as a separator, and "/" is not one.
  static HString fileNameOf(const HString& i_rPath);

private:
  CsmExporter();
  /// Rotates the scene into the written axes (`i_sign` 1) or back (`i_sign` -1).
  void rotateForUpAxis(double i_sign) const;
  void writeHeader();
  /// Whether a module of the list is written: a marker with a parent.
  bool isWritten(const Module* i_pModule) const;
  void writeOrder();
  void writePoints();

  CSMExportOptions m_options;
};
