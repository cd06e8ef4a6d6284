#pragma once
// The base of every view the terminal hosts, and the terminal's side of the
// message channel. The terminal creates a view through its class descriptor,
// hands it the services, then talks to it only through these virtual operations.
#include <QBrush>
#include <QPoint>
#include <QWidget>
#include <cstdint>
#include <map>
#include <string>
#include <unordered_map>

#include "hostview/Services.h"
#include "hostview/Types.h"

class CSuperBaseView;
class CCustomTabCtrl;

// Implemented by the terminal for the views it created.
class HV_API IViewHost {
 public:
  virtual ~IViewHost();
  // A request from `view`. The terminal may answer by calling
  // view->OnHostMessage before returning (synchronous answers).
  virtual void OnChildFeedback(CSuperBaseView* view, UINT message, LPARAM data) = 0;
  // Whether the view sits in a floating frame.
  virtual bool IsPopview(const CSuperBaseView* view) const { return false; }
  // Tab plumbing: re-create `view` as a tab of `tabs` (owned by `owner`).
  virtual void RestoreView(CSuperBaseView* owner, CSuperBaseView* view, CCustomTabCtrl* tabs,
                           const std::string& className, QPoint point, int flags) {}
  // Drop plumbing: a drop on `owner`'s tab control.
  virtual LRESULT DragDrop(CSuperBaseView* owner, CCustomTabCtrl* tabs, UINT message, LPARAM data) { return 0; }
};

// Run-time class descriptor: lets the terminal create a view by class name.
struct HV_API CRuntimeClass {
  const char* m_lpszClassName = nullptr;
  int m_nObjectSize = 0;
  unsigned m_wSchema = 0xFFFF;  // no serialisation
  CSuperBaseView* (*m_pfnCreateObject)() = nullptr;
  const CRuntimeClass* m_pBaseClass = nullptr;

  // A new default-constructed object (no window yet); null when not creatable.
  CSuperBaseView* CreateObject() const { return m_pfnCreateObject ? m_pfnCreateObject() : nullptr; }
};

using StartParamMap = std::map<std::string, std::wstring>;

class HV_API CSuperBaseView : public QWidget {
  Q_OBJECT
 public:
  explicit CSuperBaseView(QWidget* parent = nullptr);
  ~CSuperBaseView() override;

  static const CRuntimeClass classCSuperBaseView;
  virtual const CRuntimeClass* GetRuntimeClass() const { return &classCSuperBaseView; }

  // ---- The contract, in slot order ----
  virtual void vRecvMsg(UINT message, LPARAM data) {}
  virtual void vChangeSymbol() {}
  virtual void* pGetMenu() { return nullptr; }
  virtual void vOnMenu(UINT commandId) {}
  virtual void SetMainMenu(void* menu) {}
  virtual void ChangeStyle(int styleId) { m_styleId = styleId; }
  virtual void SetStyleManager(IStyleManager* styleManager) { m_pStyleManager = styleManager; }
  virtual void SetStyleID(int styleId) { m_styleId = styleId; }
  virtual void SetAppTitle(std::wstring title) { m_appTitle = std::move(title); }
  virtual void SetMenuManager(IMenuManager* menuManager) { m_pMenuManager = menuManager; }
  virtual void SetLanguage(ILanguage* language) { m_pLanguage = language; }
  virtual void ApplyLanguage() {}
  virtual void SetLog(ILogFactory* logFactory) { m_pLogFactory = logFactory; }
  // Host -> view. Returns a message-specific value (0 when unhandled).
  virtual std::uint32_t OnHostMessage(UINT message, LPARAM data) { return 0; }
  // View -> host. Hands the request to the terminal that owns the view.
  virtual void SendChildFeedback(UINT message, LPARAM data);
  virtual bool EnableDragOut() { return false; }
  virtual bool EnableDropIn(const char* sourceClassName) { return false; }
  virtual bool EnableDropIn() { return false; }
  virtual void SetDragDrop(std::wstring kind) { m_dragKind = std::move(kind); }
  virtual LRESULT DoDragDrop(UINT message, LPARAM data) { return 0; }
  virtual CCustomTabCtrl* GetTabWnd() { return nullptr; }
  virtual std::wstring GetTitle() { return {}; }
  virtual void AddTabView(CSuperBaseView* view) {}
  virtual void CopyTabViews(CSuperBaseView* other) {}
  virtual void SetCurTabView(int index) {}
  virtual int GetTabCount() { return 0; }
  virtual void RestoreView(CSuperBaseView* view, QPoint point, int flags) {}

  // ---- Non-virtual base operations ----
  void SetStartParam(std::int64_t productId, const std::string& instrumentCode, const StartParamMap& params);
  std::int64_t GetStartProductId() const { return m_startProductId; }
  const std::string& GetStartInstrumentCode() const { return m_startInstrumentCode; }
  const StartParamMap& GetStartParams() const { return m_startParams; }
  // A cached solid brush of the colour.
  const QBrush& GetSolidBrush(COLORREF color);
  bool IsPopview() const;
  void SaveParent(QWidget* frame) { m_savedParent = frame; }
  QWidget* GetSavedParent() const { return m_savedParent; }
  void ReRestoreView(CSuperBaseView* view, QPoint point, int flags, CCustomTabCtrl* tabs,
                     const std::string& className);
  LRESULT DragDrop(UINT message, LPARAM data, CCustomTabCtrl* tabs);

  // ---- Terminal side ----
  void SetHost(IViewHost* host) { m_pHost = host; }
  IViewHost* GetHost() const { return m_pHost; }
  // Creates the view's child controls (the window-creation handler). The
  // terminal calls it once after the services are set; 0 on success.
  int Create();
  bool IsCreated() const { return m_created; }

  IStyleManager* GetStyleManager() const { return m_pStyleManager; }
  ILanguage* GetLanguage() const { return m_pLanguage; }
  ILogFactory* GetLogFactory() const { return m_pLogFactory; }
  IMenuManager* GetMenuManager() const { return m_pMenuManager; }
  int GetStyleID() const { return m_styleId; }
  const std::wstring& GetAppTitle() const { return m_appTitle; }

 protected:
  // The window-creation handler: derived views call the base, then build children.
  virtual int OnCreate() { return 0; }

  IStyleManager* m_pStyleManager = nullptr;
  ILanguage* m_pLanguage = nullptr;
  ILogFactory* m_pLogFactory = nullptr;
  IMenuManager* m_pMenuManager = nullptr;
  int m_styleId = 0;
  std::wstring m_appTitle;
  std::wstring m_dragKind;

 private:
  IViewHost* m_pHost = nullptr;
  bool m_created = false;
  QWidget* m_savedParent = nullptr;
  std::int64_t m_startProductId = -1;
  std::string m_startInstrumentCode;
  StartParamMap m_startParams;
  std::unordered_map<COLORREF, QBrush> m_brushes;
};
