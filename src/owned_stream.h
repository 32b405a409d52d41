// A standard I/O stream with one owner, closed when the owner lets it go. For files the run
// writes and must check, Host::OutputFile is the owner instead.
#pragma once

#include <cstdio>
#include <memory>

struct StreamCloser {
  void operator()(std::FILE* stream) const { std::fclose(stream); }
};

/// An open stream, or null; closing it by hand means `std::fclose(stream.release())`, which
/// hands back the close's own result.
using OwnedStream = std::unique_ptr<std::FILE, StreamCloser>;
