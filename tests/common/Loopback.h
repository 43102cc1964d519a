#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

// Loopback sockets for tests and benchmarks that talk to a qensim of this build.

// A socket bound to a free loopback port, not yet listening; `port` is its number.
inline int BindLoopback(unsigned short& port) {
  int fd = socket(AF_INET, SOCK_STREAM, 0);
  sockaddr_in addr{};
  addr.sin_family = AF_INET;
  addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  bind(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr);
  socklen_t len = sizeof addr;
  getsockname(fd, reinterpret_cast<sockaddr*>(&addr), &len);
  port = ntohs(addr.sin_port);
  return fd;
}

// A loopback port that was free a moment ago (for a socket whose number qensim does not print).
inline unsigned short FreeLoopbackPort() {
  unsigned short port = 0;
  close(BindLoopback(port));
  return port;
}

// A connected socket to 127.0.0.1:`port`, Nagle off unless asked for; -1 when nothing answers.
inline int ConnectLoopback(unsigned short port, bool noDelay = true) {
  int fd = socket(AF_INET, SOCK_STREAM, 0);
  sockaddr_in addr{};
  addr.sin_family = AF_INET;
  addr.sin_port = htons(port);
  addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  if (connect(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0) {
    close(fd);
    return -1;
  }
  int on = noDelay ? 1 : 0;
  setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
  return fd;
}
