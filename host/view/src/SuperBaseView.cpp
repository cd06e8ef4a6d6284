#include "hostview/SuperBaseView.h"

IStyleManager::~IStyleManager() = default;
ILanguage::~ILanguage() = default;
ILogger::~ILogger() = default;
ILogFactory::~ILogFactory() = default;
IMenuManager::~IMenuManager() = default;
IViewHost::~IViewHost() = default;

const CRuntimeClass CSuperBaseView::classCSuperBaseView{"CSuperBaseView", sizeof(CSuperBaseView), 0xFFFF,
                                                        nullptr, nullptr};

CSuperBaseView::CSuperBaseView(QWidget* parent) : QWidget(parent) {}
CSuperBaseView::~CSuperBaseView() = default;

void CSuperBaseView::SendChildFeedback(UINT message, LPARAM data) {
  if (m_pHost) m_pHost->OnChildFeedback(this, message, data);
}

void CSuperBaseView::SetStartParam(std::int64_t productId, const std::string& instrumentCode,
                                   const StartParamMap& params) {
  m_startProductId = productId;
  m_startInstrumentCode = instrumentCode;
  m_startParams = params;
}

const QBrush& CSuperBaseView::GetSolidBrush(COLORREF color) {
  auto it = m_brushes.find(color);
  if (it == m_brushes.end())
    it = m_brushes.emplace(color, QBrush(QColor(int(ColorRefRed(color)), int(ColorRefGreen(color)),
                                                int(ColorRefBlue(color)))))
             .first;
  return it->second;
}

bool CSuperBaseView::IsPopview() const { return m_pHost && m_pHost->IsPopview(this); }

void CSuperBaseView::ReRestoreView(CSuperBaseView* view, QPoint point, int flags, CCustomTabCtrl* tabs,
                                   const std::string& className) {
  if (m_pHost) m_pHost->RestoreView(this, view, tabs, className, point, flags);
}

LRESULT CSuperBaseView::DragDrop(UINT message, LPARAM data, CCustomTabCtrl* tabs) {
  return m_pHost ? m_pHost->DragDrop(this, tabs, message, data) : 0;
}

int CSuperBaseView::Create() {
  if (m_created) return 0;
  m_created = true;
  return OnCreate();
}
