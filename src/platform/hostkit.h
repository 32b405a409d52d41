// The support library: command-line parsing driven by the usage text, strings, file names and
// files, time formatting, child processes and a message manager, implemented in lib/hostkit/.
// The program reaches the host system only through this header.
#pragma once

#include <cstdint>
#include <cstdio>
#include <ctime>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace Host {

/// An owned byte string (any byte, NUL included) with the operations the program needs.
class StringBase {
 public:
  StringBase() = default;
  StringBase(const char* text)
      : m_Text(text != nullptr ? text : "") {}               // NOLINT: implicit by design
  StringBase(std::string_view text) : m_Text(text) {}        // NOLINT
  StringBase(std::string text) : m_Text(std::move(text)) {}  // NOLINT

  StringBase& operator=(std::string_view text) {
    m_Text.assign(text);
    return *this;
  }
  // Exact matches for the common argument types, which would otherwise be ambiguous between
  // the string_view assignment and the implicit conversions to StringBase.
  StringBase& operator=(const char* text) {
    return *this = std::string_view(text != nullptr ? text : "");
  }
  StringBase& operator=(const std::string& text) { return *this = std::string_view(text); }
  StringBase& operator+=(std::string_view text) {
    m_Text.append(text);
    return *this;
  }

  const char* c_str() const { return m_Text.c_str(); }
  const std::string& str() const { return m_Text; }
  std::string_view view() const { return m_Text; }
  size_t Length() const { return m_Text.size(); }
  bool IsEmpty() const { return m_Text.empty(); }
  /// Makes the string empty.
  void Empty() { m_Text.clear(); }

  /// Replaces the contents with printf-style formatted text. The format must be a literal.
  void Format(const char* format, ...) __attribute__((format(printf, 2, 3)));

  /// 0 when equal; negative or positive like strcmp otherwise. Mode 0 compares bytes exactly,
  /// mode 1 ignores the case of ASCII letters.
  int Compare(std::string_view other, int mode) const;

  /// Replaces every occurrence of `from` (matched as Compare's `mode` says) by `to`, left to
  /// right without rescanning replaced text. Returns the number of replacements.
  int Replace(std::string_view from, std::string_view to, int mode);

  /// Convert ASCII letters only; every other byte and the length stay.
  void MakeUpper();
  void MakeLower();

 private:
  std::string m_Text;
};

/// A path split into its parts (both '/' and '\\' separate components).
class FileName {
 public:
  explicit FileName(std::string_view path) : m_Path(path) {}
  /// The extension of the last component with its leading dot (".tcl"), or empty.
  StringBase GetExtension() const;
  /// The last path component.
  StringBase GetTail() const;
  /// Everything before the last component, without a trailing separator; empty if none.
  StringBase GetDirectory() const;

 private:
  std::string m_Path;
};

class File {
 public:
  /// True when `path` names an existing regular file.
  static bool isfile(const char* path);
  /// Delete the named file; true on success.
  static bool remove(const char* path);
  /// Delete the named file even when it is read-only; true on success.
  static bool remove_f(const char* path);
  /// A name free for a new file in the system's temporary directory. Prefer createTemporary,
  /// which cannot race with another process.
  static StringBase tmpnam(const char* buffer);
  /// Creates a new file exclusively, with an unpredictable name ending in `suffix`, in the
  /// system's temporary directory ($TMPDIR or /tmp), and opens it for writing. Null on failure;
  /// `name` receives the file's path on success.
  static std::FILE* createTemporary(std::string_view suffix, std::string& name);
  /// The directory holding the running executable; empty when it cannot be found.
  static std::string executableDirectory();
  /// The folder temporary files are created in: $TMPDIR when set and not empty, else /tmp.
  static std::string temporaryDirectory();
  /// Identifies `path` by what it is, not how it is spelled: an existing file by its device
  /// and inode (symlinks followed, so "./x", a symlink and a hard link all match), a file yet
  /// to be created by its folder's identity and its last component. Empty when neither can
  /// be found. `regular` is set when the path names an existing regular file.
  static std::string identity(const char* path, bool& regular);
  /// Opens `path` for reading only when it is a regular file, never blocking on a FIFO and
  /// never reading a device. Null otherwise; `notRegular` is then set when the path could be
  /// opened but names neither a regular file nor a folder (a FIFO, a device).
  static std::FILE* openRegular(const char* path, bool& notRegular);
};

/// A file the run writes, with every write, flush and close checked and the first failure
/// kept with its reason. With Placement::Replace a regular file, or one that does not exist
/// yet, is written to a new temporary file in the same folder and only put in place by
/// commit(); until then the previous file is untouched, and the temporary file is removed on
/// destruction, by discard() and on SIGINT, SIGTERM or SIGHUP (see Interrupt). Anything else
/// (a device such as /dev/null, a FIFO, a symlink such as /dev/stdout) is written directly,
/// as are the other placements.
class OutputFile {
 public:
  enum class Placement {
    Replace,         ///< atomic replacement as described above
    InPlace,         ///< opened like fopen "w": created or truncated where it is
    InPlaceNoFollow  ///< as InPlace, but a symlink at `path` is refused, never followed
  };

  OutputFile();
  ~OutputFile();
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;

  /// Opens `path` for writing. False with `error` set to the reason (strerror's text).
  /// A new file gets the permissions fopen would give it (0666 less the umask); a replaced
  /// regular file keeps its permission bits and, where allowed, its owner and group.
  bool open(const char* path, Placement placement, std::string& error);
  /// The stream to write to; null when not open or already closed.
  std::FILE* stream() const { return m_Stream; }
  /// Flushes and closes the stream. False with the reason when this or any earlier write
  /// failed. Does nothing, successfully, when the stream is already closed.
  bool close(std::string& error);
  /// Closes the stream if needed, then renames the temporary file over the target. Does
  /// nothing for a file written in place. False with the reason; the target is then
  /// untouched and the temporary file is removed.
  bool commit(std::string& error);
  /// Closes the stream and removes the uncommitted temporary file; the target stays as it was.
  void discard();
  /// Removes the target when it is a regular file this object wrote (committed, or written
  /// in place under its own name) and still the same file. Never removes a device, a file
  /// reached through a symlink, or one it did not open. True when removed.
  bool removeWritten();

 private:
  struct Sink;
  std::unique_ptr<Sink> m_Sink;
  std::FILE* m_Stream = nullptr;
  std::string m_Path;
  std::string m_Temporary;
  bool m_Removable = false;  ///< a regular file at m_Path with this device and inode is ours
  uint64_t m_Device = 0;
  uint64_t m_Inode = 0;
};

/// Receives the output of a child process.
class ChildOutput {
 public:
  virtual ~ChildOutput() = default;
  /// One piece of the child's output (standard output and standard error, as it arrives; any
  /// byte, NUL included). Returns true to keep receiving.
  virtual bool OnOutput(std::string_view text) = 0;
  /// Called once when the child has ended.
  virtual void OnEnd() {}
};

class Process {
 public:
  /// The program's command line in UTF-8, whatever the host's own encoding. Call it once,
  /// first thing in main: on Windows it reads the UTF-16 command line and makes standard
  /// input, output and error binary, so output bytes are the template's bytes with no carriage
  /// return added; elsewhere it returns `argv` as given.
  static std::vector<std::string> startup(int argc, char** argv);

  /// The entries of the list in environment variable `name` (such as PATH), in order, split
  /// at the host's list separator (':', or ';' on Windows); empty entries are left out.
  static std::vector<std::string> environmentList(const char* name);

  /// The path of the program `name` (a bare file name): the one in the folder of this
  /// executable when there is one, else the first in a PATH folder. Empty and relative PATH
  /// entries are skipped, so nothing is ever taken from the current folder. Empty when none
  /// is found.
  static std::string findProgram(std::string_view name);

  /// Runs the program at the path `argv[0]` (not looked up) with the arguments `argv[1..]`,
  /// passed as they are, without a shell. The child starts in a process group of its own,
  /// registered with Interrupt (whose handlers this installs) while it runs, so a signal to
  /// this process stops it and all it started. It inherits no open file but its standard
  /// streams: standard input is /dev/null, standard output and standard error go to
  /// `receiver` (which may be null). Returns after the child has ended: 0 only for a normal
  /// exit with code 0; otherwise the child's exit code, 128 plus the number of the signal that
  /// killed it, or -1 when it could not be started.
  static int run(const std::vector<std::string>& argv, ChildOutput* receiver);
};

/// What an interrupted run leaves behind. Once installed, SIGINT, SIGTERM and SIGHUP stop
/// the registered child process group (SIGTERM, then SIGKILL after a short grace), wait for
/// it, remove the registered files, and end the process with the signal's own status.
/// Registration is cheap and safe to call at any time from the main thread.
class Interrupt {
 public:
  /// Installs the handlers; later calls do nothing.
  static void install();
  /// Removes `path` if a signal arrives before forget(path). At most kMaxFiles at once;
  /// returns false when the table is full or the path is too long.
  static bool removeOnSignal(std::string_view path);
  static void forget(std::string_view path);
  /// The process group of a running child, stopped on a signal; 0 for none.
  static void setChildGroup(long processGroup);

  static constexpr int kMaxFiles = 4;
};

}  // namespace Host

/// Time: the standard time, local-time and formatted-time functions.
class UT_TIME {
 public:
  static std::time_t Time();
  static std::tm LocalTime(std::time_t when);
  /// Formats `when` into `buffer` (capacity `size`); returns the length written, 0 on failure.
  static size_t StrFTime(char* buffer, size_t size, const char* format, const std::tm& when);
};

/// The message manager: texts go to standard error.
class Host_MsgManData {
 public:
  /// A manager for messages from `module`, raised in `sourceFile` at `line` of `revision`.
  /// Texts go out as they are given, so none of the four is kept.
  static std::unique_ptr<Host_MsgManData> createObject(const char* module, const char* sourceFile,
                                                       int line, const char* revision);
  /// Writes `text` to standard error.
  void issueError(const char* text);
  /// Debug hook: writes nothing unless the environment variable PINFORGE_DEBUG_STUB is set.
  static void debugStub(const char* text);

 private:
  Host_MsgManData() = default;
};

/// One occurrence of a switch on the command line, with its arguments.
class UT_CMDSWINFO {
 public:
  /// The argument with the 0-based `index`, or null past the last.
  const char* getargtxt(uint16_t index) const;
  size_t argumentCount() const { return m_Arguments.size(); }

 private:
  friend class UT_CMDARGS;
  std::vector<std::string> m_Arguments;
};

/// The command-line parser. Its switch declarations are read from the usage text itself: the
/// first word is the program's name; "{...}" a group that may repeat, "[...]" optional, "<word>"
/// one argument, "[<word>]" an optional one, "{<word>}" any number of arguments, "a|b" one
/// argument (values are not enforced). A switch outside every group must be given. An argument
/// list ends at the next word that begins with "-". "-x" and "--x" name the same switch. Every
/// command-line word must be a declared switch or an argument of the switch before it; a switch
/// given more often than declared is accepted, and each occurrence is kept.
class UT_CMDARGS {
 public:
  /// Parses `argv[1..argc-1]` against `usage`. On a malformed command line writes
  /// "<program>: <reason>" (the program named by the usage text's first word) and
  /// "Usage: <usage>" to standard error (iserror()); on -h, -help, --help or -?, unless the
  /// usage declares them, writes "Usage: <usage>" to standard output (gaveusage()). Parsing
  /// stops at the first of these. `callback` and `option` are accepted for compatibility.
  UT_CMDARGS(int argc, char** argv, const char* usage, void* callback, int option);
  ~UT_CMDARGS();

  bool iserror() const { return m_Error; }
  bool gaveusage() const { return m_GaveUsage; }
  /// True when the switch (either spelling) was given.
  bool findsw(const char* name) const;
  /// The occurrence with the 0-based index, or null after the last.
  const UT_CMDSWINFO* getsw(const char* name, uint16_t occurrence) const;

 private:
  struct Switch;
  void declare(std::string_view usage);
  void match(int argc, char** argv);
  const Switch* find(std::string_view name) const;
  Switch* find(std::string_view name);
  void fail(std::string_view reason);

  std::string m_Usage;
  std::string m_Program;
  std::vector<Switch> m_Switches;
  bool m_Error = false;
  bool m_GaveUsage = false;
};
