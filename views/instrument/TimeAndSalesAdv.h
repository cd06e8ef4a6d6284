#pragma once
// The time and sales of one instrument. This is the view's frame on the shared single-instrument base; its
// subscription and grid are built on top of it.
#include "views/instrument/SingleInstrumentView.h"

class CTimeAndSalesAdv : public CSingleInstrumentView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CTimeAndSalesAdv)
 public:
  CTimeAndSalesAdv();
  ~CTimeAndSalesAdv() override;

 protected:
  void OnActivate() override;
  void OnDeactivate() override;
};
