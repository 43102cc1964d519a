#include "toolkit/HeadlessToolkit.h"

#include <chrono>
#include <cstdio>
#include <thread>

#include "support/MeasTimer.h"

namespace {

// The longest a ProcessNext sleeps before looking again, so that an interrupt is seen soon.
constexpr double kSlice = 0.05;

}  // namespace

HeadlessToolkit::HeadlessToolkit() {
  mAlertSink = [](const Dstring& text, Icon) { std::fprintf(stderr, "%s\n", text.c_str()); };
}

double HeadlessToolkit::Now() const { return mManualNow ? *mManualNow : MeasTimer::SteadySeconds(); }

void HeadlessToolkit::UseManualClock(double* now) { mManualNow = now; }

void HeadlessToolkit::StartCBackAlarm(unsigned ms, Proc proc, void* client) {
  mAlarmProc = proc;
  mAlarmClient = client;
  mAlarmDue = Now() + ms / 1000.0;
}

void HeadlessToolkit::StopCBackAlarm() {
  mAlarmProc = nullptr;
  mAlarmClient = nullptr;
}

void HeadlessToolkit::CallDeferred(Proc proc, void* client) { mDeferred.emplace_back(proc, client); }

bool HeadlessToolkit::RunOneDeferred() {
  if (mDeferred.empty()) return false;
  auto [proc, client] = mDeferred.front();
  mDeferred.pop_front();
  proc(client);
  return true;
}

bool HeadlessToolkit::FireAlarmIfDue() {
  if (!mAlarmProc || Now() < mAlarmDue) return false;
  Proc proc = mAlarmProc;
  void* client = mAlarmClient;
  mAlarmProc = nullptr;
  proc(client);
  return true;
}

void HeadlessToolkit::Update() {
  while (RunOneDeferred()) {
  }
  FireAlarmIfDue();
}

void HeadlessToolkit::ProcessNext() {
  WaitAndHandleOne();
  if (mAfterEvent) mAfterEvent();
}

void HeadlessToolkit::WaitAndHandleOne() {
  if (RunOneDeferred() || FireAlarmIfDue()) return;
  if (mManualNow) {
    if (mAlarmProc) {
      *mManualNow = mAlarmDue;
      FireAlarmIfDue();
    }
    return;
  }
  double wait = mAlarmProc ? std::min(kSlice, mAlarmDue - Now()) : kSlice;
  if (wait > 0 && !mInterrupted) std::this_thread::sleep_for(std::chrono::duration<double>(wait));
  mInterrupted = false;
  FireAlarmIfDue();
}

void HeadlessToolkit::Alert(const Dstring& text, Icon icon) {
  mAlerts.push_back(text);
  if (mAlertSink) mAlertSink(text, icon);
}

int HeadlessToolkit::AskYesNo(const Dstring& text) {
  mQuestions.push_back(text);
  if (mAnswers.empty()) return kNo;
  int answer = mAnswers.front();
  mAnswers.pop_front();
  return answer;
}

int HeadlessToolkit::AskChoice(const Dstring& text, const Dstring&, const Dstring&) {
  mQuestions.push_back(text);
  if (mAnswers.empty()) return kCancel;
  int answer = mAnswers.front();
  mAnswers.pop_front();
  return answer;
}

void HeadlessToolkit::RegisterScriptItems(const char*, const std::vector<Dstring>& names, unsigned) {
  mScriptItems += static_cast<unsigned>(names.size());
}
