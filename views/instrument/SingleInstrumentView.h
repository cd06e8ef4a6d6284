#pragma once
// The shared frame of the three single-instrument views (depth, time and
// sales, trade summary): the registration value from the user registry, the
// activation sequence and the display mode. Each view adds its subscription
// and grid on top.
#include "addon/AddonView.h"

class CSingleInstrumentView : public CAddonView {
  Q_OBJECT
 public:
  explicit CSingleInstrumentView(const addon::ViewClassInfo& info);
  ~CSingleInstrumentView() override;

  // Handed out by the user registry at creation, returned at destruction.
  int RegistrationValue() const { return m_user.Id(); }
  // Whether this view applies updates of the shared stores (its value is current).
  bool IsCurrentRegistration() const { return m_user.IsFirst(); }

  bool EnableDragOut() override { return true; }
  bool EnableDropIn() override { return true; }

 protected:
  // Joins the user registry; a derived view calls this first.
  int OnCreate() override;
  void OnActivate() override;
  void OnDeactivate() override;

 private:
  addon::Membership m_user{addon::UserViews};
};
