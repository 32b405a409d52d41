// Child processes on Windows: programs are looked up with the PATHEXT extensions, batch files
// run under the command interpreter, and the child runs with its standard output and standard
// error on two pipes. A second thread drains standard error while
// the caller's thread drains standard output, so neither pipe can fill up and stall the child.
// Each child runs in a job object, so that an interrupt also ends whatever the child started.
#include <windows.h>

#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "hostkit/path_list.h"
#include "hostkit/wide_text-win32.h"
#include "platform/hostkit.h"

namespace {

using Host::win32::narrow;
using Host::win32::widen;

constexpr int kNotStarted = -1;

std::string environmentValue(const wchar_t* name) {
  const DWORD needed = ::GetEnvironmentVariableW(name, nullptr, 0);
  if (needed == 0) return std::string();
  std::wstring value(needed, L'\0');
  const DWORD length = ::GetEnvironmentVariableW(name, value.data(), needed);
  value.resize(length < needed ? length : 0);
  return narrow(value);
}

bool endsWithIgnoringCase(std::string_view text, std::string_view tail) {
  return text.size() >= tail.size() &&
         Host::StringBase(text.substr(text.size() - tail.size())).Compare(tail, 1) == 0;
}

/// "C:\\..." or "\\\\server\\...": a folder that does not depend on the current one.
bool isAbsoluteFolder(std::string_view folder) {
  const auto separator = [](char c) { return c == '\\' || c == '/'; };
  if (folder.size() >= 3 && folder[1] == ':' && separator(folder[2])) return true;
  return folder.size() >= 2 && separator(folder[0]) && separator(folder[1]);
}

/// `name` in `folder`: as written when it has an extension, else with the first PATHEXT
/// extension that names a file, as the command prompt looks programs up.
std::string programIn(std::string_view folder, std::string_view name,
                      const std::vector<std::string>& extensions) {
  std::string base(folder);
  if (base.back() != '\\' && base.back() != '/') base += '\\';
  base += name;
  if (!Host::FileName(name).GetExtension().IsEmpty())
    return Host::File::isfile(base.c_str()) ? base : std::string();
  for (const std::string& extension : extensions)
    if (Host::File::isfile((base + extension).c_str())) return base + extension;
  return std::string();
}

/// One word as the C runtime's argument parser will read it back.
std::string quoteWord(const std::string& word) {
  if (!word.empty() && word.find_first_of(" \t\n\v\"") == std::string::npos) return word;
  std::string quoted = "\"";
  size_t backslashes = 0;
  for (char c : word) {
    if (c == '\\') {
      ++backslashes;
      continue;
    }
    // Backslashes are literal unless a quote follows them.
    quoted.append(c == '"' ? backslashes * 2 + 1 : backslashes, '\\');
    backslashes = 0;
    quoted.push_back(c);
  }
  quoted.append(backslashes * 2, '\\');
  quoted.push_back('"');
  return quoted;
}

/// The image to start and the command line it receives. A batch file runs under the command
/// interpreter, which takes the whole quoted line after /s /c as written.
void buildLaunch(const std::vector<std::string>& argv, std::wstring& image,
                 std::wstring& commandLine) {
  std::string line = quoteWord(argv[0]);
  for (size_t i = 1; i < argv.size(); ++i) line += ' ' + quoteWord(argv[i]);
  if (endsWithIgnoringCase(argv[0], ".cmd") || endsWithIgnoringCase(argv[0], ".bat")) {
    std::string shell = environmentValue(L"ComSpec");
    if (shell.empty()) shell = "cmd.exe";
    image = widen(shell);
    commandLine = widen(quoteWord(shell) + " /d /s /c \"" + line + '"');
  } else {
    image = widen(argv[0]);
    commandLine = widen(line);
  }
}

class Handle {
 public:
  Handle() = default;
  explicit Handle(HANDLE handle) : m_Handle(handle) {}
  ~Handle() { reset(); }
  Handle(const Handle&) = delete;
  Handle& operator=(const Handle&) = delete;
  HANDLE get() const { return m_Handle; }
  HANDLE* out() {
    reset();
    return &m_Handle;
  }
  bool valid() const { return m_Handle != nullptr && m_Handle != INVALID_HANDLE_VALUE; }
  void reset() {
    if (valid()) ::CloseHandle(m_Handle);
    m_Handle = nullptr;
  }

 private:
  HANDLE m_Handle = nullptr;
};

/// A pipe whose writing end the child inherits and whose reading end stays ours.
struct Pipe {
  Handle read;
  Handle write;
  bool open() {
    SECURITY_ATTRIBUTES inherit{sizeof(SECURITY_ATTRIBUTES), nullptr, TRUE};
    return ::CreatePipe(read.out(), write.out(), &inherit, 0) != 0 &&
           ::SetHandleInformation(read.get(), HANDLE_FLAG_INHERIT, 0) != 0;
  }
};

// Passes what both reading threads get on to the receiver, one piece at a time. Once the
// receiver declines, the output is still read, so the child never blocks on a full pipe, but
// no longer passed on.
class Forwarder {
 public:
  explicit Forwarder(Host::ChildOutput* receiver) : m_Receiver(receiver) {}
  void deliver(const char* data, size_t length) {
    std::lock_guard<std::mutex> guard(m_Lock);
    if (m_Receiver != nullptr && !m_Receiver->OnOutput(std::string_view(data, length)))
      m_Receiver = nullptr;
  }

 private:
  std::mutex m_Lock;
  Host::ChildOutput* m_Receiver;
};

// Reads until the child and everything that inherited the pipe have closed it.
void drain(HANDLE pipe, Forwarder& forwarder) {
  char buffer[65536];
  DWORD got = 0;
  while (::ReadFile(pipe, buffer, sizeof buffer, &got, nullptr) && got > 0)
    forwarder.deliver(buffer, got);
}

/// The attribute list that limits what a child inherits to the given handles.
class HandleList {
 public:
  HandleList(HANDLE* handles, size_t count) {
    SIZE_T size = 0;
    ::InitializeProcThreadAttributeList(nullptr, 1, 0, &size);
    m_Storage.resize(size);
    auto* list = reinterpret_cast<LPPROC_THREAD_ATTRIBUTE_LIST>(m_Storage.data());
    if (size == 0 || !::InitializeProcThreadAttributeList(list, 1, 0, &size)) return;
    m_List = list;
    if (!::UpdateProcThreadAttribute(list, 0, PROC_THREAD_ATTRIBUTE_HANDLE_LIST, handles,
                                     count * sizeof(HANDLE), nullptr, nullptr)) {
      ::DeleteProcThreadAttributeList(list);
      m_List = nullptr;
    }
  }
  ~HandleList() {
    if (m_List != nullptr) ::DeleteProcThreadAttributeList(m_List);
  }
  HandleList(const HandleList&) = delete;
  HandleList& operator=(const HandleList&) = delete;
  LPPROC_THREAD_ATTRIBUTE_LIST get() const { return m_List; }

 private:
  std::vector<char> m_Storage;
  LPPROC_THREAD_ATTRIBUTE_LIST m_List = nullptr;
};

/// A job that ends its processes when its last handle closes: when we end, so does the child.
HANDLE makeJob() {
  HANDLE job = ::CreateJobObjectW(nullptr, nullptr);
  if (job == nullptr) return nullptr;
  JOBOBJECT_EXTENDED_LIMIT_INFORMATION limits{};
  limits.BasicLimitInformation.LimitFlags = JOB_OBJECT_LIMIT_KILL_ON_JOB_CLOSE;
  ::SetInformationJobObject(job, JobObjectExtendedLimitInformation, &limits, sizeof limits);
  return job;
}

int spawnAndCollect(const std::vector<std::string>& argv, Host::ChildOutput* receiver) {
  if (argv.empty() || !Host::win32::usableName(argv[0])) return kNotStarted;
  std::wstring image;
  std::wstring commandLine;
  buildLaunch(argv, image, commandLine);
  Pipe out;
  Pipe err;
  SECURITY_ATTRIBUTES inherit{sizeof(SECURITY_ATTRIBUTES), nullptr, TRUE};
  Handle input(::CreateFileW(L"NUL", GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE, &inherit,
                             OPEN_EXISTING, 0, nullptr));
  if (!out.open() || !err.open() || !input.valid()) return kNotStarted;

  // The child inherits these three handles and nothing else, so it cannot hold our output
  // or error file open.
  HANDLE inherited[3] = {input.get(), out.write.get(), err.write.get()};
  HandleList handles(inherited, 3);
  STARTUPINFOEXW startup{};
  startup.StartupInfo.cb = sizeof startup;
  startup.StartupInfo.dwFlags = STARTF_USESTDHANDLES;
  startup.StartupInfo.hStdInput = inherited[0];
  startup.StartupInfo.hStdOutput = inherited[1];
  startup.StartupInfo.hStdError = inherited[2];
  startup.lpAttributeList = handles.get();
  // Without a console of our own, a console child would open a window of its own.
  DWORD creation = CREATE_SUSPENDED | CREATE_UNICODE_ENVIRONMENT | EXTENDED_STARTUPINFO_PRESENT;
  if (::GetConsoleWindow() == nullptr) creation |= CREATE_NO_WINDOW;
  PROCESS_INFORMATION process{};
  if (handles.get() == nullptr ||
      !::CreateProcessW(image.c_str(), commandLine.data(), nullptr, nullptr, TRUE, creation,
                        nullptr, nullptr, &startup.StartupInfo, &process))
    return kNotStarted;
  Handle processHandle(process.hProcess);
  Handle threadHandle(process.hThread);
  Host::Interrupt::install();
  Handle job(makeJob());
  if (job.valid() && ::AssignProcessToJobObject(job.get(), process.hProcess))
    Host::Interrupt::setChildGroup(static_cast<long>(reinterpret_cast<intptr_t>(job.get())));
  ::ResumeThread(process.hThread);
  // Only the child may hold the writing ends, or the pipes would never report their end.
  out.write.reset();
  err.write.reset();
  input.reset();

  Forwarder forwarder(receiver);
  std::thread errors(drain, err.read.get(), std::ref(forwarder));
  drain(out.read.get(), forwarder);
  errors.join();
  ::WaitForSingleObject(process.hProcess, INFINITE);
  Host::Interrupt::setChildGroup(0);
  DWORD code = 0;
  if (!::GetExitCodeProcess(process.hProcess, &code)) return kNotStarted;
  return static_cast<int>(code);
}

}  // namespace

namespace Host {

std::vector<std::string> Process::environmentList(const char* name) {
  return splitPathList(environmentValue(widen(name).c_str()), ';');
}

std::string Process::findProgram(std::string_view name) {
  if (name.empty() || name.find_first_of(std::string_view("/\\:\0", 4)) != std::string_view::npos)
    return std::string();
  std::vector<std::string> extensions = Host::splitPathList(environmentValue(L"PATHEXT"), ';');
  if (extensions.empty()) extensions = {".COM", ".EXE", ".BAT", ".CMD"};
  const std::string exeDir = File::executableDirectory();
  if (!exeDir.empty()) {
    std::string found = programIn(exeDir, name, extensions);
    if (!found.empty()) return found;
  }
  for (const std::string& folder : environmentList("PATH")) {
    // A relative entry depends on the current folder; a program is never taken from there.
    if (!isAbsoluteFolder(folder)) continue;
    std::string found = programIn(folder, name, extensions);
    if (!found.empty()) return found;
  }
  return std::string();
}

int Process::run(const std::vector<std::string>& argv, ChildOutput* receiver) {
  return spawnAndCollect(argv, receiver);
}

}  // namespace Host
