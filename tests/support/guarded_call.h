// Calls an export on a fenced workspace and turns a fault into a message:
// which buffer's page was hit, from which side, how far, reading or writing.
// One GuardedCall at a time: it holds the process's fault handlers while it
// lives.
#pragma once

#include <setjmp.h>
#include <signal.h>
#include <ucontext.h>
#include <xmmintrin.h>

#include <sstream>
#include <string>
#include <vector>

#include "frame/descriptor.h"

namespace zel::test {

class GuardedCall {
 public:
  struct Outcome {
    bool faulted = false;
    Status status = StatusOk;
    std::string message;  // where the fault was
  };

  GuardedCall() {
    struct sigaction sa {};
    sa.sa_sigaction = &GuardedCall::onFault;
    sa.sa_flags = SA_SIGINFO | SA_NODEFER;
    sigemptyset(&sa.sa_mask);
    sigaction(SIGSEGV, &sa, &oldSegv_);
    sigaction(SIGBUS, &sa, &oldBus_);
  }
  ~GuardedCall() {
    sigaction(SIGSEGV, &oldSegv_, nullptr);
    sigaction(SIGBUS, &oldBus_, nullptr);
  }
  GuardedCall(const GuardedCall&) = delete;
  GuardedCall& operator=(const GuardedCall&) = delete;

  Outcome call(meta::Workspace& w) { return call(w, w.arguments()); }

  Outcome call(meta::Workspace& w, const std::vector<meta::Arg>& args) {
    Outcome out;
    const unsigned csr = _mm_getcsr();
    if (sigsetjmp(jump(), 1) == 0) {
      out.status = w.call(args);
      return out;
    }
    // The call was left midway: put back the rounding mode it may have set.
    _mm_setcsr(csr);
    out.faulted = true;
    out.message = describe(w, address(), writing());
    return out;
  }

  // Reads one byte: a test of the fence itself.
  Outcome touch(meta::Workspace& w, const uint8_t* p) {
    Outcome out;
    if (sigsetjmp(jump(), 1) == 0) {
      sink() = *static_cast<const volatile uint8_t*>(p);
      return out;
    }
    out.faulted = true;
    out.message = describe(w, address(), writing());
    return out;
  }

 private:
  static sigjmp_buf& jump() {
    static sigjmp_buf j;
    return j;
  }
  static const void*& address() {
    static const void* a;
    return a;
  }
  static bool& writing() {
    static bool w;
    return w;
  }
  static volatile uint8_t& sink() {
    static volatile uint8_t s;
    return s;
  }

  static void onFault(int, siginfo_t* info, void* context) {
    address() = info->si_addr;
    // Bit 1 of the page fault's error code: the access was a write.
    writing() = (static_cast<ucontext_t*>(context)->uc_mcontext.gregs[REG_ERR] & 2) != 0;
    siglongjmp(jump(), 1);
  }

  static std::string distance(const meta::Memory& m, const void* p) {
    const auto* q = static_cast<const uint8_t*>(p);
    std::ostringstream o;
    if (q >= m.end()) {
      const long n = long(q - m.end()) + 1;
      o << n << (n == 1 ? " byte" : " bytes") << " past its end";
    } else if (q < m.begin()) {
      const long n = long(m.begin() - q);
      o << n << (n == 1 ? " byte" : " bytes") << " before its start";
    } else {
      o << "inside it";
    }
    return o.str();
  }

  static std::string describe(meta::Workspace& w, const void* p, bool write) {
    std::ostringstream o;
    o << (write ? "wrote " : "read ");
    for (const meta::Workspace::Buffer& b : w.buffers())
      if (b.bytes.mapped(p)) {
        o << (b.side == 0 ? "source" : b.side == 1 ? "destination" : b.side == 2 ? "in-place image" : "scratch")
          << " plane " << b.plane << " " << distance(b.bytes, p);
        return o.str();
      }
    const meta::Descriptor& d = w.descriptor();
    for (size_t i = 0; i < d.extras.size(); ++i)
      if (w.record(int(i)).mapped(p)) {
        o << "the record of " << d.extras[i].name << " " << distance(w.record(int(i)), p);
        return o.str();
      }
    o << "address " << p << ", outside every buffer";
    return o.str();
  }

  struct sigaction oldSegv_ {};
  struct sigaction oldBus_ {};
};

}  // namespace zel::test
