#include <cstdlib>

#include "instrument/QenGuiInst.h"
#include "instrument/QenTcpInstrument.h"

void QenGuiInst::ListServerHostsAtPort(DstringList& found, unsigned short port, unsigned long timeoutMs,
                                       const DstringList& candidates) {
  found.clear();
  for (const Dstring& host : candidates) {
    QenTcpInstrument probe;
    probe.SetConnectTimeoutMs(static_cast<int>(timeoutMs));
    if (probe.Connect(host, port) == 0) {
      found.push_back(host);
      probe.Disconnect();
    }
  }
}

DstringList QenGuiInst::CandidateHosts(const DstringList& remembered) {
  DstringList hosts = {"127.0.0.1"};
  auto add = [&hosts](const Dstring& host) {
    const Dstring trimmed = host.Trimmed();
    if (!trimmed.empty() && !hosts.Contains(trimmed)) hosts.push_back(trimmed);
  };
  if (const char* env = std::getenv("QEN_SERVER_HOSTS")) {
    for (const Dstring& host : DstringList::Split(env, ',')) add(host);
  }
  for (const Dstring& host : remembered) add(host);
  return hosts;
}
