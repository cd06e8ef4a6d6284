#pragma once
// The market depth of one instrument. This is the view's frame on the shared single-instrument base; its
// subscription and grid are built on top of it.
#include "views/instrument/SingleInstrumentView.h"

class CMarketDepthAdv : public CSingleInstrumentView {
  Q_OBJECT
  ADDON_DECLARE_VIEW(CMarketDepthAdv)
 public:
  CMarketDepthAdv();
  ~CMarketDepthAdv() override;
};
