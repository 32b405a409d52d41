// The message manager: errors go to standard error at once; debug texts only when the
// environment asks for them, so a normal run stays quiet.
#include <cstdio>
#include <cstdlib>
#include <memory>

#include "platform/hostkit.h"

std::unique_ptr<Host_MsgManData> Host_MsgManData::createObject(const char* /*module*/,
                                                               const char* /*sourceFile*/,
                                                               int /*line*/,
                                                               const char* /*revision*/) {
  return std::unique_ptr<Host_MsgManData>(new Host_MsgManData());
}

void Host_MsgManData::issueError(const char* text) {
  if (text == nullptr) return;
  std::fputs(text, stderr);
  std::fflush(stderr);
}

void Host_MsgManData::debugStub(const char* text) {
  if (text == nullptr || std::getenv("PINFORGE_DEBUG_STUB") == nullptr) return;
  std::fputs(text, stderr);
  std::fflush(stderr);
}
