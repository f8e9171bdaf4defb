//===- Namespace.cpp - Opening, listing, creating and deleting namespaces -===//
#include "Netlink.h"

#include <linux/magic.h>
#include <linux/nsfs.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/statfs.h>
#include <thread>
#include <unistd.h>

#ifndef NSFS_MAGIC
#define NSFS_MAGIC 0x6e736673
#endif

namespace LinuxNet {

namespace {

constexpr const char* kNetnsDir = "/run/netns";

std::string NamespacePath(const std::string& name) {
  return std::string(kNetnsDir) + "/" + name;
}

/// Refuses names that are not a single path component.
void CheckName(const std::string& name) {
  if (name.empty() || name == "." || name == ".." || name.find('/') != std::string::npos ||
      name.find('\0') != std::string::npos || name.size() > NAME_MAX)
    throw Error(EINVAL, "'" + name + "' is not a valid network namespace name");
}

[[noreturn]] void Missing(const std::string& name) {
  throw Error(ENOENT, "the network namespace " + name + " does not exist");
}

/// Fails with the capability that namespace management needs.
[[noreturn]] void FailManaging(int err, const std::string& what, const std::string& name) {
  if (err == EPERM || err == EACCES)
    throw Error(err, "permission denied: " + what + " the network namespace " + name +
                         " needs CAP_SYS_ADMIN");
  throw Error(err, what + " the network namespace " + name + ": " + strerror(err));
}

} // namespace

Namespace::Namespace(std::unique_ptr<Detail::Sockets> sockets) : sockets_(std::move(sockets)) {}
Namespace::Namespace(Namespace&&) noexcept = default;
Namespace& Namespace::operator=(Namespace&&) noexcept = default;
Namespace::~Namespace() = default;

Namespace Namespace::Open(const std::string& name) {
  auto sockets = std::make_unique<Detail::Sockets>();
  if (name.empty())
    return Namespace(std::move(sockets));
  CheckName(name);
  const std::string path = NamespacePath(name);
  int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) {
    if (errno == ENOENT || errno == ENOTDIR)
      Missing(name);
    FailManaging(errno, "opening", name);
  }
  // A file left behind by a creation that failed is not a namespace.
  if (ioctl(fd, NS_GET_NSTYPE) != CLONE_NEWNET) {
    close(fd);
    Missing(name);
  }
  sockets->name = name;
  sockets->fd = fd;
  return Namespace(std::move(sockets));
}

const std::string& Namespace::Name() const {
  return sockets_->name;
}

std::string Namespace::ResolvConfPath() const {
  return IsOwn() ? "/etc/resolv.conf" : "/etc/netns/" + Name() + "/resolv.conf";
}

std::string Namespace::HostsPath() const {
  return IsOwn() ? "/etc/hosts" : "/etc/netns/" + Name() + "/hosts";
}

int Namespace::OpenSocket(int domain, int type, int protocol) const {
  Detail::Entered inside(*sockets_);
  int fd = socket(domain, type, protocol);
  if (fd < 0)
    throw Error(errno, std::string("cannot open a socket: ") + strerror(errno));
  return fd;
}

std::vector<std::string> ListNamespaces() {
  std::vector<std::string> names;
  DIR* dir = opendir(kNetnsDir);
  if (!dir) {
    if (errno == ENOENT)
      return names;
    throw Error(errno, std::string("cannot list ") + kNetnsDir + ": " + strerror(errno));
  }
  while (dirent* entry = readdir(dir)) {
    const std::string name = entry->d_name;
    if (name == "." || name == "..")
      continue;
    struct statfs fs {};
    if (statfs(NamespacePath(name).c_str(), &fs) == 0 &&
        static_cast<unsigned long>(fs.f_type) == NSFS_MAGIC)
      names.push_back(name);
  }
  closedir(dir);
  std::sort(names.begin(), names.end());
  return names;
}

void CreateNamespace(const std::string& name) {
  CheckName(name);
  if (mkdir(kNetnsDir, 0755) != 0 && errno != EEXIST)
    FailManaging(errno, "creating", name);
  // As `ip netns add`: /run/netns is a shared mount point, so that the bind
  // mounts below are seen from every mount namespace.
  if (mount("", kNetnsDir, "none", MS_SHARED | MS_REC, nullptr) != 0) {
    if (errno != EINVAL)
      FailManaging(errno, "creating", name);
    if (mount(kNetnsDir, kNetnsDir, "none", MS_BIND | MS_REC, nullptr) != 0 ||
        mount("", kNetnsDir, "none", MS_SHARED | MS_REC, nullptr) != 0)
      FailManaging(errno, "creating", name);
  }
  const std::string path = NamespacePath(name);
  int fd = open(path.c_str(), O_RDONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0);
  if (fd < 0) {
    if (errno == EEXIST)
      throw Error(EEXIST, "the network namespace " + name + " already exists");
    FailManaging(errno, "creating", name);
  }
  close(fd);
  // The new namespace is made by a thread of its own, which ends with it: the
  // caller's thread stays where it is whatever happens.
  int err = 0;
  std::thread maker([&] {
    if (unshare(CLONE_NEWNET) != 0 ||
        mount("/proc/thread-self/ns/net", path.c_str(), "none", MS_BIND, nullptr) != 0)
      err = errno;
  });
  maker.join();
  if (err) {
    unlink(path.c_str());
    FailManaging(err, "creating", name);
  }
}

void DeleteNamespace(const std::string& name) {
  CheckName(name);
  const std::string path = NamespacePath(name);
  struct stat st {};
  if (lstat(path.c_str(), &st) != 0)
    Missing(name);
  if (umount2(path.c_str(), MNT_DETACH) != 0 && errno != EINVAL)
    FailManaging(errno, "deleting", name);
  if (unlink(path.c_str()) != 0)
    FailManaging(errno, "deleting", name);
}

} // namespace LinuxNet
