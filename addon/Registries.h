#pragma once
// Process-wide registries of views. Each hands out increasing ids (from 1,
// never reused) and keeps its members in joining order; the member that
// joined first and has not left is "first" (the leading member). UI thread
// only; no locks.
//
//   OpenPriceViews()  price views, joined at window creation: the first applies
//                     store-wide watchlist replies and runs the per-second work.
//   ActiveViews()     views between activation (2) and deactivation (1): the
//                     first runs the quote store's periodic step and flushes
//                     pending subscriptions.
//   UserViews()       the user registry of the single-instrument views, joined
//                     at creation: a view's registration value is "current"
//                     while it is the first, so updates of shared stores are
//                     applied once however many views are open.
//   AlertListViews()  alert list views, joined at window creation: the first
//                     stores incoming alert lists.
#include <cstdint>
#include <vector>

class CSuperBaseView;

namespace addon {

class ViewRegistry {
 public:
  // Adds `view` at the end and returns its id (> 0).
  int Join(CSuperBaseView* view);
  // Removes the member with `id`; unknown ids (0 included) are ignored.
  void Leave(int id);
  // The id of the first member; 0 when empty.
  int First() const { return m_members.empty() ? 0 : m_members.front().id; }
  CSuperBaseView* FirstView() const { return m_members.empty() ? nullptr : m_members.front().view; }
  bool IsFirst(int id) const { return id != 0 && First() == id; }
  bool Contains(int id) const;
  std::size_t Count() const { return m_members.size(); }
  std::vector<CSuperBaseView*> Views() const;
  // Empty, ids from 1 again (tests, with every view gone; see data/ProcessState.h).
  void ResetForTests() {
    m_members.clear();
    m_nextId = 1;
  }

 private:
  struct Member {
    int id;
    CSuperBaseView* view;
  };
  std::vector<Member> m_members;
  int m_nextId = 1;
};

ViewRegistry& OpenPriceViews();
ViewRegistry& ActiveViews();
ViewRegistry& UserViews();
ViewRegistry& AlertListViews();

// A view's place in one registry; leaves it when destroyed. Not copyable.
class Membership {
 public:
  explicit Membership(ViewRegistry& (*registry)()) : m_registry(registry) {}
  ~Membership() { Leave(); }
  Membership(const Membership&) = delete;
  Membership& operator=(const Membership&) = delete;

  // Joins once; a second call keeps the first id.
  int Join(CSuperBaseView* view);
  void Leave();
  int Id() const { return m_id; }
  bool IsMember() const { return m_id != 0; }
  bool IsFirst() const { return m_id != 0 && m_registry().IsFirst(m_id); }

 private:
  ViewRegistry& (*m_registry)();
  int m_id = 0;
};

}  // namespace addon
