#include "addon/Registries.h"

#include <algorithm>

#include "data/ProcessState.h"

namespace addon {

int ViewRegistry::Join(CSuperBaseView* view) {
  const int id = m_nextId++;
  m_members.push_back({id, view});
  return id;
}

void ViewRegistry::Leave(int id) {
  if (id == 0) return;
  auto it = std::find_if(m_members.begin(), m_members.end(), [id](const Member& m) { return m.id == id; });
  if (it != m_members.end()) m_members.erase(it);
}

bool ViewRegistry::Contains(int id) const {
  return std::any_of(m_members.begin(), m_members.end(), [id](const Member& m) { return m.id == id; });
}

std::vector<CSuperBaseView*> ViewRegistry::Views() const {
  std::vector<CSuperBaseView*> views;
  views.reserve(m_members.size());
  for (const auto& m : m_members) views.push_back(m.view);
  return views;
}

ViewRegistry& OpenPriceViews() {
  static ViewRegistry registry;
  static const bool hook = mvd::OnResetForTests([] { registry.ResetForTests(); });
  (void)hook;
  return registry;
}
ViewRegistry& ActiveViews() {
  static ViewRegistry registry;
  static const bool hook = mvd::OnResetForTests([] { registry.ResetForTests(); });
  (void)hook;
  return registry;
}
ViewRegistry& UserViews() {
  static ViewRegistry registry;
  static const bool hook = mvd::OnResetForTests([] { registry.ResetForTests(); });
  (void)hook;
  return registry;
}
ViewRegistry& AlertListViews() {
  static ViewRegistry registry;
  static const bool hook = mvd::OnResetForTests([] { registry.ResetForTests(); });
  (void)hook;
  return registry;
}

int Membership::Join(CSuperBaseView* view) {
  if (m_id == 0) m_id = m_registry().Join(view);
  return m_id;
}

void Membership::Leave() {
  if (m_id == 0) return;
  m_registry().Leave(m_id);
  m_id = 0;
}

}  // namespace addon
