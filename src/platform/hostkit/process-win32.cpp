// Child processes on Windows: the command line is split into words as on other systems, the
// program is looked up on PATH with the PATHEXT extensions, and the child runs with its
// standard output and standard error on two pipes. A second thread drains standard error while
// the caller's thread drains standard output, so neither pipe can fill up and stall the child.
// Each child runs in a job object, so that an interrupt also ends whatever the child started.
#include <windows.h>

#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "platform/hostkit.h"
#include "platform/wide_text-win32.h"

namespace {

using Host::win32::narrow;
using Host::win32::widen;

constexpr int kNotStarted = -1;

// Blanks and tabs separate words; a double-quoted stretch keeps its blanks and loses its quotes.
std::vector<std::string> splitCommandLine(std::string_view line) {
  std::vector<std::string> words;
  std::string word;
  bool inWord = false;
  bool quoted = false;
  for (char c : line) {
    if (c == '"') {
      quoted = !quoted;
      inWord = true;
    } else if (!quoted && (c == ' ' || c == '\t')) {
      if (inWord) words.push_back(std::move(word));
      word.clear();
      inWord = false;
    } else {
      word.push_back(c);
      inWord = true;
    }
  }
  if (inWord) words.push_back(std::move(word));
  return words;
}

std::string environmentValue(const wchar_t* name) {
  const DWORD needed = ::GetEnvironmentVariableW(name, nullptr, 0);
  if (needed == 0) return std::string();
  std::wstring value(needed, L'\0');
  const DWORD length = ::GetEnvironmentVariableW(name, value.data(), needed);
  value.resize(length < needed ? length : 0);
  return narrow(value);
}

std::vector<std::string> splitList(std::string_view list) {
  std::vector<std::string> items;
  while (!list.empty()) {
    const size_t semicolon = list.find(';');
    if (semicolon != 0) items.emplace_back(list.substr(0, semicolon));
    if (semicolon == std::string_view::npos) break;
    list.remove_prefix(semicolon + 1);
  }
  return items;
}

bool isFile(const std::string& path) { return Host::File::isfile(path.c_str()); }

bool endsWithIgnoringCase(std::string_view text, std::string_view tail) {
  return text.size() >= tail.size() &&
         Host::StringBase(text.substr(text.size() - tail.size())).Compare(tail, 1) == 0;
}

/// The file `program` names: itself when it holds a folder, else the first match on PATH.
/// A name without an extension also tries each PATHEXT extension, as the command prompt does.
std::string findProgram(const std::string& program) {
  std::vector<std::string> extensions = splitList(environmentValue(L"PATHEXT"));
  if (extensions.empty()) extensions = {".COM", ".EXE", ".BAT", ".CMD"};
  const bool hasExtension = !Host::FileName(program).GetExtension().IsEmpty();
  const auto tryIn = [&](const std::string& base) -> std::string {
    if (hasExtension && isFile(base)) return base;
    for (const std::string& extension : extensions)
      if (isFile(base + extension)) return base + extension;
    return std::string();
  };
  if (program.find_first_of("/\\:") != std::string::npos) return tryIn(program);
  for (const std::string& folder : splitList(environmentValue(L"PATH"))) {
    const char last = folder.back();
    const std::string found = tryIn(folder + (last == '\\' || last == '/' ? "" : "\\") + program);
    if (!found.empty()) return found;
  }
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
bool buildLaunch(const std::vector<std::string>& words, std::wstring& image,
                 std::wstring& commandLine) {
  const std::string program = findProgram(words[0]);
  if (program.empty()) return false;
  std::string line = quoteWord(program);
  for (size_t i = 1; i < words.size(); ++i) line += ' ' + quoteWord(words[i]);
  if (endsWithIgnoringCase(program, ".cmd") || endsWithIgnoringCase(program, ".bat")) {
    std::string shell = environmentValue(L"ComSpec");
    if (shell.empty()) shell = "cmd.exe";
    image = widen(shell);
    commandLine = widen(quoteWord(shell) + " /d /s /c \"" + line + '"');
  } else {
    image = widen(program);
    commandLine = widen(line);
  }
  return true;
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

// Hands each read piece on as NUL-terminated text; a NUL inside the output ends a piece. Both
// reading threads deliver through it, one at a time.
class Forwarder {
 public:
  explicit Forwarder(Host::ChildOutput* receiver) : m_Receiver(receiver) {}
  void deliver(const char* data, size_t length) {
    std::lock_guard<std::mutex> guard(m_Lock);
    size_t start = 0;
    while (m_Receiver != nullptr && start < length) {
      std::string_view rest(data + start, length - start);
      const size_t end = rest.find('\0');
      const std::string piece(rest.substr(0, end));
      start += piece.size() + 1;
      if (!piece.empty() && !m_Receiver->OnOutput(piece.c_str())) m_Receiver = nullptr;
    }
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

/// A job that ends its processes when its last handle closes: when we end, so does the child.
HANDLE makeJob() {
  HANDLE job = ::CreateJobObjectW(nullptr, nullptr);
  if (job == nullptr) return nullptr;
  JOBOBJECT_EXTENDED_LIMIT_INFORMATION limits{};
  limits.BasicLimitInformation.LimitFlags = JOB_OBJECT_LIMIT_KILL_ON_JOB_CLOSE;
  ::SetInformationJobObject(job, JobObjectExtendedLimitInformation, &limits, sizeof limits);
  return job;
}

int spawnAndCollect(const std::vector<std::string>& words, Host::ChildOutput* receiver) {
  std::wstring image;
  std::wstring commandLine;
  if (words.empty() || !buildLaunch(words, image, commandLine)) return kNotStarted;
  Pipe out;
  Pipe err;
  SECURITY_ATTRIBUTES inherit{sizeof(SECURITY_ATTRIBUTES), nullptr, TRUE};
  Handle input(::CreateFileW(L"NUL", GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE, &inherit,
                             OPEN_EXISTING, 0, nullptr));
  if (!out.open() || !err.open() || !input.valid()) return kNotStarted;

  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  startup.dwFlags = STARTF_USESTDHANDLES;
  startup.hStdInput = input.get();
  startup.hStdOutput = out.write.get();
  startup.hStdError = err.write.get();
  // Without a console of our own, a console child would open a window of its own.
  DWORD creation = CREATE_SUSPENDED | CREATE_UNICODE_ENVIRONMENT;
  if (::GetConsoleWindow() == nullptr) creation |= CREATE_NO_WINDOW;
  PROCESS_INFORMATION process{};
  if (!::CreateProcessW(image.c_str(), commandLine.data(), nullptr, nullptr, TRUE, creation,
                        nullptr, nullptr, &startup, &process))
    return kNotStarted;
  Handle processHandle(process.hProcess);
  Handle threadHandle(process.hThread);
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

int Process::RunNoWindow(const char* commandLine, std::unique_ptr<ChildOutput> receiver,
                         unsigned /*flags*/, bool /*hideWindow*/, bool /*captureOutput*/,
                         bool /*detach*/) {
  const int status =
      commandLine != nullptr ? spawnAndCollect(splitCommandLine(commandLine), receiver.get())
                             : kNotStarted;
  if (receiver != nullptr) receiver->OnEnd();
  return status;
}

}  // namespace Host
