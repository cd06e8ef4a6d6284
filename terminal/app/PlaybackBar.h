#pragma once
// The playback bar of a replayed market: play and pause, the speed (1x, 2x,
// 5x, 10x, 60x), a jump forward to a time of day, and where the replay
// stands. Its status label says that the market is a replay, and of which day.
#include <QLabel>
#include <QToolBar>

class QComboBox;
class QTimeEdit;
class QToolButton;

namespace term {

class ReplaySource;

class PlaybackBar : public QToolBar {
  Q_OBJECT
 public:
  explicit PlaybackBar(ReplaySource& replay, QWidget* parent = nullptr);

  // For the window's status bar (the bar does not own its place there).
  QLabel* StatusLabel() const { return m_status; }
  // Shows the replay's time and state; call after the market moved.
  void Refresh();

  QToolButton* PlayButton() const { return m_play; }
  QComboBox* SpeedBox() const { return m_speed; }
  QTimeEdit* JumpTime() const { return m_jumpTime; }
  QToolButton* JumpButton() const { return m_jump; }
  QLabel* TimeLabel() const { return m_time; }

 signals:
  // Something the user should read (a jump backwards was refused...).
  void notice(const QString& text);

 private:
  void TogglePause();
  void SpeedChosen(int row);
  void Jump();
  std::uint64_t TimeOfDayToElapsed(int msOfDay) const;
  QString Clock(std::uint64_t elapsedMs) const;

  ReplaySource& m_replay;
  QToolButton* m_play;
  QComboBox* m_speed;
  QTimeEdit* m_jumpTime;
  QToolButton* m_jump;
  QLabel* m_time;
  QLabel* m_status;
};

}  // namespace term
