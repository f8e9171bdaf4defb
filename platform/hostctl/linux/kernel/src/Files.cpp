//===- Files.cpp - resolv.conf, hosts and atomic rewrites -----------------===//
#include "LinuxNet/Files.h"
#include "LinuxNet/Error.h"
#include "LinuxNet/Ip.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <sstream>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace LinuxNet {

namespace {

std::vector<std::string> SplitLines(const std::string& text) {
  std::vector<std::string> lines;
  std::size_t start = 0;
  while (start < text.size()) {
    std::size_t end = text.find('\n', start);
    if (end == std::string::npos)
      end = text.size();
    lines.push_back(text.substr(start, end - start));
    start = end + 1;
  }
  return lines;
}

std::string JoinLines(const std::vector<std::string>& lines) {
  std::string text;
  for (const std::string& line : lines)
    text += line + "\n";
  return text;
}

/// Blank-separated words of \p line up to a comment.
std::vector<std::string> Words(const std::string& line, bool hashComments = true) {
  std::vector<std::string> words;
  std::string word;
  for (char c : line) {
    if ((c == '#' && hashComments))
      break;
    if (c == ' ' || c == '\t' || c == '\r') {
      if (!word.empty())
        words.push_back(std::move(word));
      word.clear();
    } else {
      word += c;
    }
  }
  if (!word.empty())
    words.push_back(std::move(word));
  return words;
}

/// The keyword of a resolv.conf line; "" for comments and blanks.
std::string Keyword(const std::string& line) {
  auto words = Words(line);
  if (words.empty() || words[0][0] == ';')
    return {};
  return words[0];
}

/// An address in canonical form when it parses (a scope suffix is kept).
std::string Canonical(const std::string& address) {
  const auto percent = address.find('%');
  auto parsed = IpAddress::TryParse(address.substr(0, percent));
  if (!parsed)
    return address;
  return parsed->ToString() + (percent == std::string::npos ? "" : address.substr(percent));
}

bool IsAddress(const std::string& address) {
  const auto percent = address.find('%');
  if (percent != std::string::npos && address.find(':') == std::string::npos)
    return false;
  return IpAddress::TryParse(address.substr(0, percent)).has_value();
}

[[noreturn]] void FileError(int err, const std::string& what, const std::string& path) {
  throw Error(err, what + " " + path + ": " + strerror(err));
}

void MakeDirectories(const std::string& dir) {
  struct stat st {};
  if (dir.empty() || stat(dir.c_str(), &st) == 0)
    return;
  MakeDirectories(dir.substr(0, dir.find_last_of('/')));
  if (mkdir(dir.c_str(), 0755) != 0 && errno != EEXIST)
    FileError(errno, "cannot create", dir);
}

/// The file a write replaces: a symbolic link's target.
std::string Target(const std::string& path) {
  char* real = realpath(path.c_str(), nullptr);
  if (!real)
    return path;
  std::string target = real;
  free(real);
  return target;
}

std::string DirOf(const std::string& path) {
  const auto slash = path.find_last_of('/');
  return slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
}

std::string BaseOf(const std::string& path) {
  return path.substr(path.find_last_of('/') + 1);
}

/// Temporary files of a rewrite are named ".BASE.tmp-XXXXXX".
std::string TempPrefix(const std::string& base) {
  return "." + base + ".tmp-";
}

} // namespace

// --- resolv.conf -----------------------------------------------------------

ResolvConf ResolvConf::Parse(const std::string& text) {
  ResolvConf conf;
  conf.lines_ = SplitLines(text);
  return conf;
}

ResolvConf ResolvConf::Load(const std::string& path) {
  return Parse(ReadTextFile(path));
}

std::vector<std::string> ResolvConf::Nameservers() const {
  std::vector<std::string> servers;
  for (const std::string& line : lines_) {
    auto words = Words(line);
    if (words.size() >= 2 && words[0] == "nameserver")
      servers.push_back(words[1]);
  }
  return servers;
}

std::vector<std::string> ResolvConf::SearchDomains() const {
  std::vector<std::string> domains;
  for (const std::string& line : lines_) {
    const std::string key = Keyword(line);
    if (key == "search" || key == "domain") {
      auto words = Words(line);
      domains.assign(words.begin() + 1, words.end());
      if (key == "domain" && domains.size() > 1)
        domains.resize(1);
    }
  }
  return domains;
}

void ResolvConf::AddNameserver(const std::string& address) {
  if (!IsAddress(address))
    throw Error(EINVAL, "'" + address + "' is not an IPv4 or IPv6 address");
  std::size_t last = lines_.size();
  for (std::size_t i = 0; i < lines_.size(); ++i) {
    auto words = Words(lines_[i]);
    if (words.size() >= 2 && words[0] == "nameserver") {
      if (Canonical(words[1]) == Canonical(address))
        throw Error(EEXIST, "the DNS server " + address + " is already listed");
      last = i + 1;
    }
  }
  lines_.insert(lines_.begin() + static_cast<std::ptrdiff_t>(last), "nameserver " + address);
}

void ResolvConf::RemoveNameserver(const std::string& address) {
  const std::size_t before = lines_.size();
  std::erase_if(lines_, [&](const std::string& line) {
    auto words = Words(line);
    return words.size() >= 2 && words[0] == "nameserver" &&
           Canonical(words[1]) == Canonical(address);
  });
  if (lines_.size() == before)
    throw Error(ENOENT, "the DNS server " + address + " is not listed");
}

void ResolvConf::RemoveAllNameservers() {
  std::erase_if(lines_, [](const std::string& line) { return Keyword(line) == "nameserver"; });
}

void ResolvConf::AddSearchDomain(const std::string& domain) {
  if (!IsValidHostName(domain))
    throw Error(EINVAL, "'" + domain + "' is not a valid domain name");
  auto domains = SearchDomains();
  for (const std::string& d : domains)
    if (strcasecmp(d.c_str(), domain.c_str()) == 0)
      throw Error(EEXIST, "the search domain " + domain + " is already listed");
  domains.push_back(domain);
  SetSearchDomains(domains);
}

void ResolvConf::RemoveSearchDomain(const std::string& domain) {
  auto domains = SearchDomains();
  const std::size_t before = domains.size();
  std::erase_if(domains,
                [&](const std::string& d) { return strcasecmp(d.c_str(), domain.c_str()) == 0; });
  if (domains.size() == before)
    throw Error(ENOENT, "the search domain " + domain + " is not listed");
  SetSearchDomains(domains);
}

void ResolvConf::SetSearchDomains(const std::vector<std::string>& domains) {
  for (const std::string& d : domains)
    if (!IsValidHostName(d))
      throw Error(EINVAL, "'" + d + "' is not a valid domain name");
  std::string line = "search";
  for (const std::string& d : domains)
    line += " " + d;
  // The last search or domain line is the one in effect: it becomes the new
  // one, and the others go.
  std::ptrdiff_t last = -1;
  for (std::size_t i = 0; i < lines_.size(); ++i) {
    const std::string key = Keyword(lines_[i]);
    if (key == "search" || key == "domain")
      last = static_cast<std::ptrdiff_t>(i);
  }
  std::vector<std::string> kept;
  for (std::size_t i = 0; i < lines_.size(); ++i) {
    const std::string key = Keyword(lines_[i]);
    if (static_cast<std::ptrdiff_t>(i) == last) {
      if (!domains.empty())
        kept.push_back(line);
    } else if (key != "search" && key != "domain") {
      kept.push_back(lines_[i]);
    }
  }
  if (last < 0 && !domains.empty())
    kept.push_back(line);
  lines_ = std::move(kept);
}

std::string ResolvConf::Text() const {
  return JoinLines(lines_);
}

// --- hosts -------------------------------------------------------------------

bool IsValidHostName(const std::string& name) {
  if (name.empty() || name.size() > 253)
    return false;
  std::size_t label = 0;
  for (std::size_t i = 0; i < name.size(); ++i) {
    const char c = name[i];
    if (c == '.') {
      if (label == 0 || name[i - 1] == '-')
        return false;
      label = 0;
      continue;
    }
    const bool ok = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
                    (c == '-' && label > 0) || c == '_';
    if (!ok || ++label > 63)
      return false;
  }
  return name.back() != '-';
}

HostsFile HostsFile::Parse(const std::string& text) {
  HostsFile hosts;
  hosts.lines_ = SplitLines(text);
  return hosts;
}

HostsFile HostsFile::Load(const std::string& path) {
  return Parse(ReadTextFile(path));
}

std::vector<HostsEntry> HostsFile::Entries() const {
  std::vector<HostsEntry> entries;
  for (const std::string& line : lines_) {
    auto words = Words(line);
    if (words.size() < 2)
      continue;
    HostsEntry e;
    e.address = words[0];
    e.names.assign(words.begin() + 1, words.end());
    const auto hash = line.find('#');
    if (hash != std::string::npos) {
      std::string comment = line.substr(hash + 1);
      const auto first = comment.find_first_not_of(" \t");
      const auto last = comment.find_last_not_of(" \t\r");
      e.comment = first == std::string::npos ? "" : comment.substr(first, last - first + 1);
    }
    entries.push_back(std::move(e));
  }
  return entries;
}

void HostsFile::Add(const std::string& address, const std::vector<std::string>& names,
                    const std::string& comment) {
  if (!IsAddress(address))
    throw Error(EINVAL, "'" + address + "' is not an IPv4 or IPv6 address");
  if (names.empty())
    throw Error(EINVAL, "a hosts entry needs a host name");
  for (const std::string& name : names)
    if (!IsValidHostName(name))
      throw Error(EINVAL, "'" + name + "' is not a valid host name");
  if (comment.find_first_of("\r\n") != std::string::npos)
    throw Error(EINVAL, "a hosts entry's comment must be one line");
  for (const HostsEntry& e : Entries())
    if (Canonical(e.address) == Canonical(address) && e.names[0] == names[0])
      throw Error(EEXIST, "the hosts entry " + address + " " + names[0] + " already exists");
  std::string line = address;
  line += "\t";
  for (std::size_t i = 0; i < names.size(); ++i)
    line += (i ? " " : "") + names[i];
  if (!comment.empty())
    line += " # " + comment;
  lines_.push_back(line);
}

void HostsFile::Remove(const std::string& address, const std::string& name) {
  const std::size_t before = lines_.size();
  std::erase_if(lines_, [&](const std::string& line) {
    auto words = Words(line);
    return words.size() >= 2 && Canonical(words[0]) == Canonical(address) && words[1] == name;
  });
  if (lines_.size() == before)
    throw Error(ENOENT, "there is no hosts entry " + address + " " + name);
}

std::string HostsFile::Text() const {
  return JoinLines(lines_);
}

// --- files -------------------------------------------------------------------

std::string ReadTextFile(const std::string& path) {
  int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) {
    if (errno == ENOENT)
      return {};
    FileError(errno, "cannot read", path);
  }
  std::string text;
  char buffer[65536];
  for (;;) {
    ssize_t n = read(fd, buffer, sizeof buffer);
    if (n < 0) {
      if (errno == EINTR)
        continue;
      const int err = errno;
      close(fd);
      FileError(err, "cannot read", path);
    }
    if (n == 0)
      break;
    text.append(buffer, static_cast<std::size_t>(n));
  }
  close(fd);
  return text;
}

void WriteFileAtomically(const std::string& path, const std::string& content) {
  const std::string target = Target(path);
  const std::string dir = DirOf(target);
  MakeDirectories(dir);
  struct stat old {};
  const bool exists = stat(target.c_str(), &old) == 0;
  std::string temp = dir + "/" + TempPrefix(BaseOf(target)) + "XXXXXX";
  int fd = mkostemp(temp.data(), O_CLOEXEC);
  if (fd < 0)
    FileError(errno, "cannot write", target);
  auto fail = [&](int err) {
    close(fd);
    unlink(temp.c_str());
    FileError(err, "cannot write", target);
  };
  if (fchmod(fd, exists ? old.st_mode & 07777 : 0644) != 0)
    fail(errno);
  if (exists && geteuid() == 0 && fchown(fd, old.st_uid, old.st_gid) != 0)
    fail(errno);
  for (std::size_t done = 0; done < content.size();) {
    ssize_t n = write(fd, content.data() + done, content.size() - done);
    if (n < 0) {
      if (errno == EINTR)
        continue;
      fail(errno);
    }
    done += static_cast<std::size_t>(n);
  }
  if (fsync(fd) != 0)
    fail(errno);
  if (close(fd) != 0) {
    const int err = errno;
    unlink(temp.c_str());
    FileError(err, "cannot write", target);
  }
  if (rename(temp.c_str(), target.c_str()) != 0) {
    const int err = errno;
    unlink(temp.c_str());
    FileError(err, "cannot write", target);
  }
  // The rename is durable once the directory is.
  int dirFd = open(dir.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (dirFd >= 0) {
    fsync(dirFd);
    close(dirFd);
  }
}

void UpdateTextFile(const std::string& path,
                    const std::function<std::string(const std::string&)>& edit) {
  const std::string target = Target(path);
  const std::string dir = DirOf(target);
  MakeDirectories(dir);
  int dirFd = open(dir.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (dirFd < 0)
    FileError(errno, "cannot open", dir);
  struct Unlock {
    int fd;
    ~Unlock() { close(fd); }
  } unlock{dirFd};
  while (flock(dirFd, LOCK_EX) != 0)
    if (errno != EINTR)
      FileError(errno, "cannot lock", dir);
  // A writer that died between creating its temporary file and renaming it
  // left the file behind; no writer holds one while we hold the lock.
  if (DIR* d = fdopendir(dup(dirFd))) {
    const std::string prefix = TempPrefix(BaseOf(target));
    std::vector<std::string> stale;
    while (dirent* entry = readdir(d))
      if (strncmp(entry->d_name, prefix.c_str(), prefix.size()) == 0)
        stale.push_back(entry->d_name);
    closedir(d);
    for (const std::string& name : stale)
      unlinkat(dirFd, name.c_str(), 0);
  }
  const std::string before = ReadTextFile(target);
  const std::string after = edit(before);
  if (after != before)
    WriteFileAtomically(target, after);
}

void UpdateResolvConf(const std::string& path, const std::function<void(ResolvConf&)>& edit) {
  UpdateTextFile(path, [&](const std::string& text) {
    ResolvConf conf = ResolvConf::Parse(text);
    edit(conf);
    // An edit that changed nothing leaves the file byte for byte as it was.
    return conf.Text() == ResolvConf::Parse(text).Text() ? text : conf.Text();
  });
}

void UpdateHostsFile(const std::string& path, const std::function<void(HostsFile&)>& edit) {
  UpdateTextFile(path, [&](const std::string& text) {
    HostsFile hosts = HostsFile::Parse(text);
    edit(hosts);
    return hosts.Text() == HostsFile::Parse(text).Text() ? text : hosts.Text();
  });
}

} // namespace LinuxNet
