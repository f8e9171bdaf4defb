//===- Sysctl.cpp - /proc/sys/net of a namespace ---------------------------===//
#include "LinuxNet/Sysctl.h"

#include "Netlink.h"

#include <cerrno>
#include <fcntl.h>
#include <unistd.h>

namespace LinuxNet {

using namespace Detail;

namespace {

/// The /proc path of a net.* key; refuses other keys and malformed ones.
std::string PathOf(const std::string& key) {
  std::string path = key;
  for (char& c : path)
    if (c == '.')
      c = '/';
  // Interface names may hold dots: "net.ipv4.conf.eth0/1" is written with a
  // slash for the dot, as sysctl(8) does; a key given with slashes is taken
  // as it is.
  if (key.find('/') != std::string::npos)
    path = key;
  bool ok = path.rfind("net/", 0) == 0 && path.find("..") == std::string::npos &&
            path.find("//") == std::string::npos && path.back() != '/';
  for (char c : path)
    ok = ok &&
         (isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '-' || c == '/' || c == '.');
  if (!ok)
    throw Error(EINVAL, "'" + key + "' is not a setting of a network namespace (net.*)");
  return "/proc/sys/" + path;
}

/// Opens the setting inside the namespace: /proc/sys/net shows the
/// namespace of the thread that opens it.
int OpenSetting(Namespace& ns, const std::string& key, int flags, bool change) {
  const std::string path = PathOf(key);
  int fd = -1;
  {
    Entered inside(ns.Internals());
    fd = open(path.c_str(), flags | O_CLOEXEC);
  }
  if (fd < 0) {
    if (errno == ENOENT)
      throw Error(ENOENT, "the setting " + key + " does not exist");
    Fail(errno, {"the setting " + key, change});
  }
  return fd;
}

} // namespace

std::string ReadSysctl(Namespace& ns, const std::string& key) {
  const int fd = OpenSetting(ns, key, O_RDONLY, false);
  std::string value;
  char buffer[4096];
  ssize_t n = 0;
  while ((n = read(fd, buffer, sizeof buffer)) > 0)
    value.append(buffer, static_cast<std::size_t>(n));
  const int err = n < 0 ? errno : 0;
  close(fd);
  if (err)
    Fail(err, {"the setting " + key, false});
  while (!value.empty() && value.back() == '\n')
    value.pop_back();
  return value;
}

void WriteSysctl(Namespace& ns, const std::string& key, const std::string& value) {
  const int fd = OpenSetting(ns, key, O_WRONLY, true);
  const ssize_t n = write(fd, value.data(), value.size());
  const int err = n < 0 ? errno : 0;
  close(fd);
  if (err == EINVAL)
    throw Error(EINVAL, "the setting " + key + ": '" + value + "' is not a valid value");
  if (err)
    Fail(err, {"the setting " + key, true});
}

} // namespace LinuxNet
