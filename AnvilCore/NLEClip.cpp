// The scene's clip list, kept by the database as a singly linked list in insertion order.
#include "plugin/host/NLEClip.h"
#include "plugin/host/Database.h"

H_IMPLEMENT_RUNTIME_CLASS(NLEClip, HObject)

NLEClip::NLEClip(const HString& i_rName, const HTimeRange& i_rRange, HTime i_startOffset)
    : m_name(i_rName), m_range(i_rRange), m_startOffset(i_startOffset) {}

void Database::setActiveClip(const NLEClip* i_pClip, bool, bool, bool) {
  m_pActiveClip = nullptr;
  for (NLEClip* p = m_pHeadClip; p; p = p->m_pNext)
    if (p == i_pClip) m_pActiveClip = p;
}

void Database::addClip(NLEClip* i_pClip) {
  if (!i_pClip) return;
  i_pClip->m_pNext = nullptr;
  NLEClip** ppLink = &m_pHeadClip;
  while (*ppLink)
    ppLink = &(*ppLink)->m_pNext;
  *ppLink = i_pClip;
}

void Database::clearClips() {
  m_pActiveClip = nullptr;
  while (NLEClip* p = m_pHeadClip) {
    m_pHeadClip = p->m_pNext;
    delete p;
  }
}
