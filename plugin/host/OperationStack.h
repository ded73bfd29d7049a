#pragma once
#include "HString.h"
#include "HostExport.h"
#include <cstdio>

/// Progress of the running operation. When the progress stream is a terminal a bar is drawn
/// there; otherwise progress is counted silently.
class ANVIL_HOST_API OperationStack {
public:
  /// Starts a task that runs from `i_low` to `i_high` steps.
  void setTaskRange(int i_low, int i_high);
  /// Advances the current task by one step.
  void stepTask();
  /// Ends the task and clears the bar.
  void endTask();

  int getLow() const { return m_low; }
  int getHigh() const { return m_high; }
  int getPosition() const { return m_position; }
  int getSteps() const { return m_steps; }
  /// Host side: where the bar goes, and whether to draw it (default: stderr if it is a tty).
  void setStream(FILE* i_pStream, bool i_draw);
  void setLabel(const HString& i_rLabel) { m_label = i_rLabel; }

private:
  void draw(bool i_final);

  int m_low = 0;
  int m_high = 0;
  int m_position = 0;
  int m_steps = 0;
  int m_drawnPercent = -1;
  FILE* m_pStream = nullptr;
  int m_draw = -1; // -1: decide on first use
  HString m_label;
};

extern ANVIL_HOST_API OperationStack g_theOperationStack;
