// Cleanup on SIGINT, SIGTERM and SIGHUP. The handler may only use async-signal-safe calls, so
// the registered paths live in fixed buffers, and the main thread blocks the signals while it
// changes them: the handler never sees a half-written entry.
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <climits>
#include <cstring>
#include <string_view>

#include "platform/hostkit.h"

namespace {

struct Slot {
  volatile sig_atomic_t used = 0;
  char path[PATH_MAX] = {};
};

Slot g_Slots[Host::Interrupt::kMaxFiles];
volatile sig_atomic_t g_ChildGroup = 0;
volatile sig_atomic_t g_Installed = 0;

constexpr int kSignals[] = {SIGINT, SIGTERM, SIGHUP};

/// Blocks the handled signals for the lifetime of the guard.
class SignalBlock {
 public:
  SignalBlock() {
    sigset_t set;
    sigemptyset(&set);
    for (int number : kSignals) sigaddset(&set, number);
    sigprocmask(SIG_BLOCK, &set, &m_Previous);
  }
  ~SignalBlock() { sigprocmask(SIG_SETMASK, &m_Previous, nullptr); }
  SignalBlock(const SignalBlock&) = delete;
  SignalBlock& operator=(const SignalBlock&) = delete;

 private:
  sigset_t m_Previous;
};

/// Stops the child's whole group: a Tcl shell may have started children of its own, and none
/// of them may write the output after we are gone.
void stopChildGroup() {
  const pid_t group = static_cast<pid_t>(g_ChildGroup);
  if (group <= 0) return;
  ::kill(-group, SIGTERM);
  // Up to about two seconds for a clean end, then no more patience.
  for (int attempt = 0; attempt < 20; ++attempt) {
    if (::waitpid(-group, nullptr, WNOHANG) < 0) return;
    const struct timespec pause = {0, 100 * 1000 * 1000};
    ::nanosleep(&pause, nullptr);
  }
  ::kill(-group, SIGKILL);
  while (::waitpid(-group, nullptr, 0) > 0) {
  }
}

void onSignal(int number) {
  stopChildGroup();
  for (Slot& slot : g_Slots)
    if (slot.used) ::unlink(slot.path);
  // End with the signal's own status, as the caller of a killed program expects. The signal
  // is blocked while its handler runs, so it is unblocked for the default action to take it.
  ::signal(number, SIG_DFL);
  sigset_t own;
  sigemptyset(&own);
  sigaddset(&own, number);
  ::sigprocmask(SIG_UNBLOCK, &own, nullptr);
  ::raise(number);
  ::_exit(128 + number);
}

}  // namespace

namespace Host {

void Interrupt::install() {
  if (g_Installed) return;
  g_Installed = 1;
  struct sigaction action {};
  action.sa_handler = onSignal;
  sigemptyset(&action.sa_mask);
  for (int number : kSignals) sigaddset(&action.sa_mask, number);
  for (int number : kSignals) {
    struct sigaction previous {};
    // A signal the caller chose to ignore (nohup, a background job) stays ignored.
    if (::sigaction(number, nullptr, &previous) == 0 && previous.sa_handler == SIG_IGN) continue;
    ::sigaction(number, &action, nullptr);
  }
}

bool Interrupt::removeOnSignal(std::string_view path) {
  if (path.empty() || path.size() >= PATH_MAX || path.find('\0') != std::string_view::npos)
    return false;
  SignalBlock block;
  for (Slot& slot : g_Slots) {
    if (slot.used) continue;
    std::memcpy(slot.path, path.data(), path.size());
    slot.path[path.size()] = '\0';
    slot.used = 1;
    return true;
  }
  return false;
}

void Interrupt::forget(std::string_view path) {
  SignalBlock block;
  for (Slot& slot : g_Slots)
    if (slot.used && std::string_view(slot.path) == path) slot.used = 0;
}

void Interrupt::setChildGroup(long processGroup) {
  SignalBlock block;
  g_ChildGroup = static_cast<sig_atomic_t>(processGroup);
}

}  // namespace Host
