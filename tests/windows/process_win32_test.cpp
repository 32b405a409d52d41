// Child processes on Windows. The test binary is its own child: started with
// PINFORGE_TEST_CHILD set, it does what the variable says before any test runs.
#include <gtest/gtest.h>
#include <windows.h>
// shellapi.h needs the types windows.h declares.
#include <shellapi.h>

#include <algorithm>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

#include "hostkit/wide_text-win32.h"
#include "platform/hostkit.h"
#include "windows/scratch_folder.h"

namespace {

using Host::win32::narrow;
using Host::win32::widen;
using pinforge_test::ScratchFolder;

constexpr size_t kFloodBytes = 300000;

void writeRaw(DWORD stream, const std::string& text) {
  DWORD written = 0;
  ::WriteFile(::GetStdHandle(stream), text.data(), static_cast<DWORD>(text.size()), &written,
              nullptr);
}

/// The child's part: flood both streams, end with a code, or echo its arguments.
[[maybe_unused]] const bool g_ChildDone = [] {
  wchar_t mode[32] = {};
  if (::GetEnvironmentVariableW(L"PINFORGE_TEST_CHILD", mode, 32) == 0) return false;
  const std::wstring what = mode;
  if (what == L"flood") {
    // Far more than a pipe holds, on both streams at once: a parent reading one stream to its
    // end before the other would wait forever.
    for (size_t done = 0; done < kFloodBytes; done += 1000) {
      writeRaw(STD_OUTPUT_HANDLE, std::string(1000, 'o'));
      writeRaw(STD_ERROR_HANDLE, std::string(1000, 'e'));
    }
    ::ExitProcess(0);
  }
  if (what == L"args") {
    int count = 0;
    wchar_t** words = ::CommandLineToArgvW(::GetCommandLineW(), &count);
    for (int i = 1; i < count; ++i) writeRaw(STD_OUTPUT_HANDLE, narrow(words[i]) + "|");
    ::ExitProcess(0);
  }
  ::ExitProcess(static_cast<UINT>(std::wcstoul(mode, nullptr, 10)));
  return true;
}();

class Collector : public Host::ChildOutput {
 public:
  explicit Collector(std::string* into) : m_Into(into) {}
  bool OnOutput(std::string_view text) override {
    m_Into->append(text);
    return true;
  }

 private:
  std::string* m_Into;
};

std::string ownPath() {
  std::wstring path(32768, L'\0');
  path.resize(::GetModuleFileNameW(nullptr, path.data(), static_cast<DWORD>(path.size())));
  return narrow(path);
}

int run(const std::vector<std::string>& argv, std::string& output,
        const wchar_t* childMode = nullptr) {
  ::SetEnvironmentVariableW(L"PINFORGE_TEST_CHILD", childMode);
  Collector collector(&output);
  const int status = Host::Process::run(argv, &collector);
  ::SetEnvironmentVariableW(L"PINFORGE_TEST_CHILD", nullptr);
  return status;
}

/// Sets PATH for the lifetime of the guard.
class PathChange {
 public:
  explicit PathChange(const std::wstring& value) {
    m_Saved.resize(32768);
    m_Saved.resize(
        ::GetEnvironmentVariableW(L"PATH", m_Saved.data(), static_cast<DWORD>(m_Saved.size())));
    ::SetEnvironmentVariableW(L"PATH", value.c_str());
  }
  ~PathChange() { ::SetEnvironmentVariableW(L"PATH", m_Saved.c_str()); }
  PathChange(const PathChange&) = delete;
  PathChange& operator=(const PathChange&) = delete;

 private:
  std::wstring m_Saved;
};

TEST(ProcessWin32, DrainsBothStreamsOfABusyChild) {
  std::string output;
  EXPECT_EQ(run({ownPath()}, output, L"flood"), 0);
  EXPECT_EQ(output.size(), 2 * kFloodBytes);
  EXPECT_EQ(static_cast<size_t>(std::count(output.begin(), output.end(), 'e')), kFloodBytes);
}

TEST(ProcessWin32, ReturnsTheExitCode) {
  for (const wchar_t* code : {L"7", L"255", L"1000"}) {
    std::string output;
    EXPECT_EQ(run({ownPath()}, output, code), std::wcstol(code, nullptr, 10));
  }
  std::string output;
  EXPECT_EQ(run({"C:\\pinforge\\no-such-program.exe"}, output), -1);
  EXPECT_EQ(run({}, output), -1);
  EXPECT_EQ(run({""}, output), -1);
}

TEST(ProcessWin32, ArgumentsArriveAsGiven) {
  const std::vector<std::string> arguments = {
      "plain", "two words",        "a\\b", "c:\\dir with space\\", "quote\"inside",
      "",      "\xc3\xa9t\xc3\xa9"};
  std::vector<std::string> argv = {ownPath()};
  argv.insert(argv.end(), arguments.begin(), arguments.end());
  std::string output;
  EXPECT_EQ(run(argv, output, L"args"), 0);
  std::string expected;
  for (const std::string& argument : arguments) expected += argument + "|";
  EXPECT_EQ(output, expected);
}

TEST(ProcessWin32, RunsBatchFiles) {
  ScratchFolder folder;
  ASSERT_TRUE(folder.write("pf stub.cmd", "@echo stub %~1\r\n@exit /b 5\r\n"));
  std::string output;
  EXPECT_EQ(run({folder.file("pf stub.cmd"), "x y"}, output), 5);
  EXPECT_EQ(output, "stub x y\r\n");
}

TEST(ProcessWin32, FindsProgramsBesideUsThenOnPathWithTheirExtensions) {
  ScratchFolder folder;
  ASSERT_TRUE(folder.write("pfstub.cmd", "@echo found\r\n"));
  ASSERT_TRUE(folder.write("pfdata.txt", ""));
  const std::string exeDir = Host::File::executableDirectory();
  {
    PathChange path(L"relative;" + widen(folder.file("")) + L";C:\\windows\\system32");
    EXPECT_EQ(Host::Process::findProgram("pfstub"), folder.file("pfstub.cmd"));
    EXPECT_EQ(Host::Process::findProgram("pfstub.cmd"), folder.file("pfstub.cmd"));
    EXPECT_EQ(Host::Process::findProgram("pfdata"), "");
    EXPECT_EQ(Host::Process::findProgram("test_windows"), exeDir + "\\test_windows.exe");
    for (const char* refused : {"", "a\\pfstub", "a/pfstub", "c:pfstub"})
      EXPECT_EQ(Host::Process::findProgram(refused), "") << refused;
    std::string output;
    EXPECT_EQ(run({Host::Process::findProgram("pfstub")}, output), 0);
    EXPECT_EQ(output, "found\r\n");
  }
  PathChange path(L"relative");
  EXPECT_EQ(Host::Process::findProgram("pfstub"), "");
}

}  // namespace
