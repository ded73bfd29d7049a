#include "plugin/host/OperationStack.h"
#include <unistd.h>

OperationStack g_theOperationStack;

void OperationStack::setStream(FILE* i_pStream, bool i_draw) {
  m_pStream = i_pStream;
  m_draw = i_draw ? 1 : 0;
}

void OperationStack::setTaskRange(int i_low, int i_high) {
  m_low = i_low;
  m_high = i_high;
  m_position = i_low;
  m_steps = 0;
  m_drawnPercent = -1;
  if (m_draw < 0) {
    m_pStream = stderr;
    m_draw = ::isatty(::fileno(stderr)) ? 1 : 0;
  }
  draw(false);
}

void OperationStack::stepTask() {
  ++m_position;
  ++m_steps;
  draw(false);
}

void OperationStack::endTask() {
  if (m_draw == 1 && m_pStream && m_drawnPercent >= 0) {
    std::fprintf(m_pStream, "\r\033[K");
    std::fflush(m_pStream);
  }
  m_drawnPercent = -1;
}

void OperationStack::draw(bool) {
  if (m_draw != 1 || !m_pStream) return;
  const int span = m_high - m_low;
  int percent = span > 0 ? (100 * (m_position - m_low)) / span : 100;
  percent = percent < 0 ? 0 : (percent > 100 ? 100 : percent);
  if (percent == m_drawnPercent) return;
  m_drawnPercent = percent;
  constexpr int kWidth = 40;
  char bar[kWidth + 1];
  for (int i = 0; i < kWidth; ++i)
    bar[i] = i < percent * kWidth / 100 ? '#' : '.';
  bar[kWidth] = '\0';
  std::fprintf(m_pStream, "\r%s [%s] %3d%%", m_label.GetStr(), bar, percent);
  std::fflush(m_pStream);
}
