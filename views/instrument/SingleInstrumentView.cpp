#include "views/instrument/SingleInstrumentView.h"

CSingleInstrumentView::CSingleInstrumentView(const addon::ViewClassInfo& info) : CAddonView(info) {}

int CSingleInstrumentView::OnCreate() {
  m_user.Join(this);
  return 0;
}

CSingleInstrumentView::~CSingleInstrumentView() = default;

void CSingleInstrumentView::OnActivate() {
  SendViewSize(270, 150);
  PrepareBasicData();
  QueryDisplayMode();
  ApplyLanguage();
  SetActiveFlag(true);
}

void CSingleInstrumentView::OnDeactivate() {
  PrepareBasicData();
  SetActiveFlag(false);
}
