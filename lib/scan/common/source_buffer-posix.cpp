// Maps files so that a 100 MB netlist costs one mapping rather than one copy, and so that the
// NUL sentinel after the last byte exists even when the file size is a multiple of the page.
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "scan/common/source_buffer.h"

namespace scan {

namespace {

// Only a regular file has a size to map and an end to reach: a FIFO would block the open and
// a device such as /dev/zero never ends.
bool refuseIrregular(const struct stat& info, std::string& error) {
  if (S_ISREG(info.st_mode)) return false;
  error = S_ISDIR(info.st_mode) ? "is a directory" : "not a regular file";
  return true;
}

}  // namespace

std::unique_ptr<SourceBuffer> SourceBuffer::open(const std::string& path, std::string& error) {
  struct stat info {};
  if (::stat(path.c_str(), &info) != 0) {
    error = std::strerror(errno);
    return nullptr;
  }
  if (refuseIrregular(info, error)) return nullptr;
  // Non-blocking, so that a file swapped for a FIFO after the stat cannot hang the open; the
  // fstat below then sees what was really opened.
  int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (fd < 0) {
    error = std::strerror(errno);
    return nullptr;
  }
  if (fstat(fd, &info) != 0) {
    error = std::strerror(errno);
    ::close(fd);
    return nullptr;
  }
  if (refuseIrregular(info, error)) {
    ::close(fd);
    return nullptr;
  }
  std::unique_ptr<SourceBuffer> buffer(new SourceBuffer);
  buffer->m_Path = path;
  size_t size = static_cast<size_t>(info.st_size);
  if (size == 0) {
    ::close(fd);
    return buffer;
  }
  // Reserve one page more than the file, then map the file over the front of it: the bytes
  // after the end are anonymous zeroes, so the sentinel never faults.
  size_t page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
  size_t total = (size / page + 1) * page;
  void* reserved = mmap(nullptr, total, PROT_READ, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (reserved == MAP_FAILED) {
    error = std::strerror(errno);
    ::close(fd);
    return nullptr;
  }
  void* mapped = mmap(reserved, size, PROT_READ, MAP_PRIVATE | MAP_FIXED, fd, 0);
  int mapErrno = errno;
  ::close(fd);
  if (mapped == MAP_FAILED) {
    munmap(reserved, total);
    error = std::strerror(mapErrno);
    return nullptr;
  }
  madvise(mapped, size, MADV_SEQUENTIAL);
  buffer->m_Mapping = reserved;
  buffer->m_MappingSize = total;
  buffer->m_Data = static_cast<const char*>(mapped);
  buffer->m_Size = size;
  return buffer;
}

SourceBuffer::~SourceBuffer() {
  if (m_Mapping) munmap(m_Mapping, m_MappingSize);
}

}  // namespace scan
