// Child processes on Windows. The test binary is its own child: started with
// PINFORGE_TEST_CHILD set, it does what the variable says before any test runs.
#include <gtest/gtest.h>
#include <windows.h>
// shellapi.h needs the types windows.h declares.
#include <shellapi.h>

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <string>

#include "platform/hostkit.h"
#include "platform/wide_text-win32.h"
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
  bool OnOutput(const char* text) override {
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

int run(const std::string& commandLine, std::string& output, const wchar_t* childMode = nullptr) {
  ::SetEnvironmentVariableW(L"PINFORGE_TEST_CHILD", childMode);
  Host::Process process;
  const int status = process.RunNoWindow(commandLine.c_str(), std::make_unique<Collector>(&output),
                                         0, true, true, false);
  ::SetEnvironmentVariableW(L"PINFORGE_TEST_CHILD", nullptr);
  return status;
}

TEST(ProcessWin32, DrainsBothStreamsOfABusyChild) {
  std::string output;
  EXPECT_EQ(run('"' + ownPath() + '"', output, L"flood"), 0);
  EXPECT_EQ(output.size(), 2 * kFloodBytes);
  EXPECT_EQ(static_cast<size_t>(std::count(output.begin(), output.end(), 'e')), kFloodBytes);
}

TEST(ProcessWin32, ReturnsTheExitCode) {
  for (const wchar_t* code : {L"7", L"255", L"1000"}) {
    std::string output;
    EXPECT_EQ(run('"' + ownPath() + '"', output, code), std::wcstol(code, nullptr, 10));
  }
  std::string output;
  EXPECT_EQ(run("pinforge-no-such-program", output), -1);
  EXPECT_EQ(run("", output), -1);
}

TEST(ProcessWin32, WordsArriveAsSplit) {
  const struct {
    const char* words;
    const char* arrived;
  } cases[] = {
      {"plain", "plain|"},
      {"\"two words\" x", "two words|x|"},
      {"a\\b \"c:\\dir with space\\\\\"", "a\\b|c:\\dir with space\\\\|"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.words);
    std::string output;
    EXPECT_EQ(run('"' + ownPath() + "\" " + c.words, output, L"args"), 0);
    EXPECT_EQ(output, c.arrived);
  }
}

TEST(ProcessWin32, RunsBatchFilesByPathAndFromPath) {
  ScratchFolder folder;
  ASSERT_TRUE(folder.write("pf stub.cmd", "@echo stub %~1\r\n@exit /b 5\r\n"));
  std::string output;
  EXPECT_EQ(run('"' + folder.file("pf stub.cmd") + "\" \"x y\"", output), 5);
  EXPECT_EQ(output, "stub x y\r\n");

  ASSERT_TRUE(folder.write("pfstub.cmd", "@echo found\r\n"));
  std::wstring path(32768, L'\0');
  path.resize(::GetEnvironmentVariableW(L"PATH", path.data(), static_cast<DWORD>(path.size())));
  const std::wstring folderName = widen(folder.file(""));
  ::SetEnvironmentVariableW(L"PATH", (folderName + L";" + path).c_str());
  output.clear();
  const int status = run("pfstub", output);
  ::SetEnvironmentVariableW(L"PATH", path.c_str());
  EXPECT_EQ(status, 0);
  EXPECT_EQ(output, "found\r\n");
}

}  // namespace
