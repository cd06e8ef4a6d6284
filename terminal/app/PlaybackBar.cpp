#include "terminal/app/PlaybackBar.h"

#include <QComboBox>
#include <QFileInfo>
#include <QTimeEdit>
#include <QToolButton>
#include <algorithm>
#include <cmath>

#include "terminal/host/ReplaySource.h"

namespace term {

namespace {
constexpr double kSpeeds[] = {1, 2, 5, 10, 60};
constexpr std::uint64_t kDayMs = 86400000;

QString SpeedText(double speed) { return QString::number(speed, 'g', 4) + QChar(0x00D7); }
}  // namespace

PlaybackBar::PlaybackBar(ReplaySource& replay, QWidget* parent) : QToolBar("Playback", parent), m_replay(replay) {
  setObjectName("PlaybackBar");
  m_play = new QToolButton(this);
  m_play->setToolTip("Play or pause the replayed market");
  addWidget(m_play);
  connect(m_play, &QToolButton::clicked, this, &PlaybackBar::TogglePause);

  addSeparator();
  addWidget(new QLabel(" Speed ", this));
  m_speed = new QComboBox(this);
  std::vector<double> speeds(std::begin(kSpeeds), std::end(kSpeeds));
  if (std::none_of(speeds.begin(), speeds.end(), [&](double s) { return std::abs(s - replay.Speed()) < 1e-9; }))
    speeds.insert(std::upper_bound(speeds.begin(), speeds.end(), replay.Speed()), replay.Speed());
  for (double s : speeds) m_speed->addItem(SpeedText(s), s);
  m_speed->setCurrentIndex(m_speed->findData(replay.Speed()));
  m_speed->setToolTip("Replay speed: market seconds per second");
  addWidget(m_speed);
  connect(m_speed, &QComboBox::activated, this, &PlaybackBar::SpeedChosen);

  addSeparator();
  addWidget(new QLabel(" Jump to ", this));
  m_jumpTime = new QTimeEdit(this);
  m_jumpTime->setDisplayFormat("HH:mm:ss");
  m_jumpTime->setToolTip("A later time of the recorded session");
  addWidget(m_jumpTime);
  m_jump = new QToolButton(this);
  m_jump->setText("Jump");
  m_jump->setToolTip("Move the replayed market forward to this time at once");
  addWidget(m_jump);
  connect(m_jump, &QToolButton::clicked, this, &PlaybackBar::Jump);
  connect(m_jumpTime, &QTimeEdit::editingFinished, this, [this] {
    if (m_jumpTime->hasFocus()) Jump();
  });

  addSeparator();
  m_time = new QLabel(this);
  m_time->setMinimumWidth(m_time->fontMetrics().horizontalAdvance("  00:00:00 of 00:00:00 (end of the recording)  "));
  addWidget(m_time);

  m_status = new QLabel(this);
  m_status->setToolTip(QString::fromStdString(replay.Path()));
  Refresh();
}

QString PlaybackBar::Clock(std::uint64_t elapsedMs) const {
  const std::uint64_t start = std::uint64_t(m_replay.Session().startSeconds) * 1000u;
  return QString::fromStdString(ClockText(std::uint32_t((start + elapsedMs) % kDayMs)));
}

std::uint64_t PlaybackBar::TimeOfDayToElapsed(int msOfDay) const {
  const std::uint64_t start = std::uint64_t(m_replay.Session().startSeconds) * 1000u;
  std::uint64_t t = std::uint64_t(std::max(msOfDay, 0));
  if (t < start) t += kDayMs;  // a session that ran past midnight
  return t - start;
}

void PlaybackBar::Refresh() {
  m_play->setText(m_replay.Paused() ? "Play" : "Pause");
  QString where = Clock(m_replay.ElapsedMs()) + " of " + Clock(m_replay.EndMs());
  if (m_replay.Ended()) where += " (end of the recording)";
  else if (m_replay.Paused()) where += " (paused)";
  m_time->setText("  " + where + "  ");
  // The jump time follows the replay until the user picks one ahead of it.
  const QTime now = QTime::fromMSecsSinceStartOfDay(int(m_replay.TimeOfDayMs()));
  if (!m_jumpTime->hasFocus() && m_jumpTime->time() < now) m_jumpTime->setTime(now);
  QString status = "Market: replay of " + QString::fromStdString(m_replay.Session().date);
  if (!m_replay.Problem().empty()) status += " - stopped: " + QString::fromStdString(m_replay.Problem());
  m_status->setText(status);
}

void PlaybackBar::TogglePause() {
  m_replay.SetPaused(!m_replay.Paused());
  Refresh();
}

void PlaybackBar::SpeedChosen(int row) {
  m_replay.SetSpeed(m_speed->itemData(row).toDouble());
  Refresh();
}

void PlaybackBar::Jump() {
  const std::uint64_t target = TimeOfDayToElapsed(m_jumpTime->time().msecsSinceStartOfDay());
  if (target <= m_replay.ElapsedMs()) {
    emit notice("The replay only jumps forward: choose a time after " + Clock(m_replay.ElapsedMs()) + ".");
    return;
  }
  if (target > m_replay.EndMs())
    emit notice("The recording ends at " + Clock(m_replay.EndMs()) + "; the replay jumps to its end.");
  m_replay.JumpTo(target);
  Refresh();
}

}  // namespace term
