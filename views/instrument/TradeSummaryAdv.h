#pragma once
// The trade summary of one instrument. This is the view's frame on the shared single-instrument base; its
// subscription and grid are built on top of it.
#include "views/instrument/SingleInstrumentView.h"

class CTradeSummaryAdv : public CSingleInstrumentView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CTradeSummaryAdv)
 public:
  CTradeSummaryAdv();
  ~CTradeSummaryAdv() override;

 protected:
  void OnActivate() override;
  void OnDeactivate() override;
};
