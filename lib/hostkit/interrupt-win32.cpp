// Cleanup when the console asks the program to stop: Ctrl+C, Ctrl+Break, the console window
// closing, logoff or shutdown. Windows runs the handler on a thread of its own, so the table of
// registered paths is guarded by a lock that the main thread holds only while it changes it.
#include <windows.h>

#include <string>
#include <string_view>

#include "hostkit/wide_text-win32.h"
#include "platform/hostkit.h"

namespace {

// What a console program ended by Ctrl+C reports as its exit code on Windows.
constexpr UINT kInterruptedStatus = 0xC000013A;

struct Slot {
  bool used = false;
  std::string path;
  std::wstring widePath;  // converted up front: the handler should not have to allocate
};

SRWLOCK g_Lock = SRWLOCK_INIT;
Slot g_Slots[Host::Interrupt::kMaxFiles];
HANDLE g_ChildJob = nullptr;
bool g_Installed = false;

/// Holds the table's lock for the lifetime of the guard.
class TableLock {
 public:
  TableLock() { ::AcquireSRWLockExclusive(&g_Lock); }
  ~TableLock() { ::ReleaseSRWLockExclusive(&g_Lock); }
  TableLock(const TableLock&) = delete;
  TableLock& operator=(const TableLock&) = delete;
};

BOOL WINAPI onConsoleEvent(DWORD /*event*/) {
  // The lock stays taken: the main thread must not register anything while the process ends.
  ::AcquireSRWLockExclusive(&g_Lock);
  // The child's job holds the Tcl shell and every process it started; none of them may write
  // the output after we are gone.
  if (g_ChildJob != nullptr) {
    ::TerminateJobObject(g_ChildJob, kInterruptedStatus);
    // Termination is asynchronous; give the processes a moment to let go of their files.
    for (int attempt = 0; attempt < 40; ++attempt) {
      JOBOBJECT_BASIC_ACCOUNTING_INFORMATION info{};
      if (!::QueryInformationJobObject(g_ChildJob, JobObjectBasicAccountingInformation, &info,
                                       sizeof info, nullptr) ||
          info.ActiveProcesses == 0)
        break;
      ::Sleep(50);
    }
  }
  for (const Slot& slot : g_Slots)
    if (slot.used) ::DeleteFileW(slot.widePath.c_str());
  ::ExitProcess(kInterruptedStatus);
  return TRUE;
}

}  // namespace

namespace Host {

void Interrupt::install() {
  if (g_Installed) return;
  g_Installed = true;
  ::SetConsoleCtrlHandler(onConsoleEvent, TRUE);
}

bool Interrupt::removeOnSignal(std::string_view path) {
  if (!win32::usableName(path) || path.size() >= 32768) return false;
  std::wstring wide = win32::widen(path);
  TableLock lock;
  for (Slot& slot : g_Slots) {
    if (slot.used) continue;
    slot.path.assign(path);
    slot.widePath = std::move(wide);
    slot.used = true;
    return true;
  }
  return false;
}

void Interrupt::forget(std::string_view path) {
  TableLock lock;
  for (Slot& slot : g_Slots)
    if (slot.used && slot.path == path) slot.used = false;
}

void Interrupt::setChildGroup(long processGroup) {
  // On Windows the group is a job object; its handle fits a long (handles keep 32 bits).
  TableLock lock;
  g_ChildJob = reinterpret_cast<HANDLE>(static_cast<intptr_t>(processGroup));
}

}  // namespace Host
