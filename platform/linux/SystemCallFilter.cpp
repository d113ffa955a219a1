#include "platform/linux/SystemCallFilter.h"

#include <fcntl.h>
#include <seccomp.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <initializer_list>
#include <memory>

namespace accounts {
namespace {

using Condition = scmp_arg_cmp;

/// What may be called with any arguments.
constexpr int kCalls[] = {
    // Memory.
    SCMP_SYS(brk),
    SCMP_SYS(munmap),
    SCMP_SYS(mremap),
    SCMP_SYS(madvise),
    // What is open: reading what was snapshotted, writing lines and results.
    SCMP_SYS(pread64),
    SCMP_SYS(write),
    SCMP_SYS(writev),
    SCMP_SYS(lseek),
    SCMP_SYS(fstat),
    SCMP_SYS(close),
    SCMP_SYS(poll),
    SCMP_SYS(ppoll),
    SCMP_SYS(recvfrom),
    // What anyone may know. Identifiers are made of random numbers, of the time and of these.
    SCMP_SYS(getrandom),
    SCMP_SYS(getpid),
    SCMP_SYS(gettid),
    SCMP_SYS(getppid),
    SCMP_SYS(getuid),
    SCMP_SYS(geteuid),
    SCMP_SYS(getgid),
    SCMP_SYS(getegid),
    SCMP_SYS(clock_gettime),
    SCMP_SYS(gettimeofday),
    SCMP_SYS(time),
    // Waiting and ending.
    SCMP_SYS(futex),
    SCMP_SYS(sched_yield),
    SCMP_SYS(restart_syscall),
    SCMP_SYS(rt_sigprocmask),
    SCMP_SYS(rt_sigreturn),
    SCMP_SYS(exit),
    SCMP_SYS(exit_group),
};

/// What reaches beyond the process itself and the files of the device.
constexpr int kForeignCalls[] = {
    SCMP_SYS(execve),
    SCMP_SYS(execveat),
    SCMP_SYS(ptrace),
    SCMP_SYS(pidfd_getfd),
    SCMP_SYS(pidfd_send_signal),
    SCMP_SYS(process_vm_readv),
    SCMP_SYS(perf_event_open),
    SCMP_SYS(process_vm_writev),
    SCMP_SYS(bpf),
    SCMP_SYS(io_uring_setup),
    SCMP_SYS(mount),
    SCMP_SYS(umount2),
    SCMP_SYS(move_mount),
    SCMP_SYS(pivot_root),
    SCMP_SYS(chroot),
    SCMP_SYS(unshare),
    SCMP_SYS(setns),
    SCMP_SYS(init_module),
    SCMP_SYS(finit_module),
    SCMP_SYS(delete_module),
    SCMP_SYS(kexec_load),
    SCMP_SYS(reboot),
};

/// Conditions on an int leave the upper half of its register out, as the kernel does.
constexpr scmp_datum_t kInt = 0xffffffff;

Condition argument(unsigned index, scmp_datum_t mask, scmp_datum_t value) {
  return {.arg = index, .op = SCMP_CMP_MASKED_EQ, .datum_a = mask, .datum_b = value};
}

struct FilterReleaser {
  void operator()(void* filter) const { ::seccomp_release(filter); }
};

/// A filter under construction; the first failure is remembered.
class Filter {
 public:
  /// `others` is what is done with calls that nothing is said of.
  explicit Filter(std::uint32_t others) : filter_(::seccomp_init(others)) {
    number_ = filter_ == nullptr ? ENOMEM : 0;
    // Calls by the numbers of another processor mode, and threads that were started before.
    set(SCMP_FLTATR_ACT_BADARCH, SCMP_ACT_KILL_PROCESS);
    set(SCMP_FLTATR_CTL_TSYNC, 1);
  }

  void set(scmp_filter_attr attribute, std::uint32_t value) {
    note([&] { return ::seccomp_attr_set(filter_.get(), attribute, value); });
  }
  void allow(int call) { add(SCMP_ACT_ALLOW, call, {}); }
  void allow(int call, std::initializer_list<Condition> conditions) {
    add(SCMP_ACT_ALLOW, call, conditions);
  }
  void trap(int call, std::initializer_list<Condition> conditions = {}) {
    add(SCMP_ACT_TRAP, call, conditions);
  }
  void refuse(int call, int error) { add(SCMP_ACT_ERRNO(static_cast<unsigned>(error)), call, {}); }
  void load() {
    note([&] { return ::seccomp_load(filter_.get()); });
  }
  [[nodiscard]] int number() const { return number_; }

 private:
  void add(std::uint32_t action, int call, std::initializer_list<Condition> conditions) {
    note([&] {
      return ::seccomp_rule_add_array(filter_.get(), action, call,
                                      static_cast<unsigned>(conditions.size()), conditions.begin());
    });
  }
  template <class Step>
  void note(Step step) {
    if (number_ == 0) {
      number_ = -step();
    }
  }

  std::unique_ptr<void, FilterReleaser> filter_;
  int number_ = 0;
};

void allowWithConditions(Filter& filter) {
  const auto self = static_cast<scmp_datum_t>(::getpid());
  // Memory of its own that is not code.
  filter.allow(SCMP_SYS(mmap),
               {argument(2, PROT_EXEC, 0), argument(3, MAP_ANONYMOUS, MAP_ANONYMOUS)});
  filter.allow(SCMP_SYS(mprotect), {argument(2, PROT_EXEC, 0)});
  // To the other end alone, not to an address.
  filter.allow(SCMP_SYS(sendto), {{.arg = 4, .op = SCMP_CMP_EQ, .datum_a = 0, .datum_b = 0}});
  // To abort, and to end itself in any other way.
  filter.allow(SCMP_SYS(rt_sigaction), {argument(0, kInt, SIGABRT)});
  filter.allow(SCMP_SYS(tgkill), {argument(0, kInt, self)});
  filter.allow(SCMP_SYS(kill), {argument(0, kInt, self)});
}

void allowJournalEntries(Filter& filter) {
  filter.allow(SCMP_SYS(sendmsg));
  filter.allow(SCMP_SYS(memfd_create));
  filter.allow(SCMP_SYS(fcntl), {argument(1, kInt, F_ADD_SEALS)});
}

}  // namespace

int filterSystemCalls(JournalEntries journalEntries) {
  Filter filter(SCMP_ACT_TRAP);
  for (const int call : kCalls) {
    filter.allow(call);
  }
  allowWithConditions(filter);
  if (journalEntries == JournalEntries::Sent) {
    allowJournalEntries(filter);
  }
  // Its arguments stand in memory, where a filter cannot look; the C library then takes the older
  // call, which is not allowed.
  filter.refuse(SCMP_SYS(clone3), ENOSYS);
  filter.load();
  return filter.number();
}

int filterForeignCalls() {
  Filter filter(SCMP_ACT_ALLOW);
  for (const int call : kForeignCalls) {
    filter.trap(call);
  }
  const auto self = static_cast<scmp_datum_t>(::getpid());
  filter.trap(SCMP_SYS(kill), {{.arg = 0, .op = SCMP_CMP_NE, .datum_a = self, .datum_b = 0}});
  filter.trap(SCMP_SYS(tgkill), {{.arg = 0, .op = SCMP_CMP_NE, .datum_a = self, .datum_b = 0}});
  filter.refuse(SCMP_SYS(socket), EACCES);
  filter.load();
  return filter.number();
}

std::string systemCallName(int number) {
  const std::unique_ptr<char, decltype(&std::free)> name(
      ::seccomp_syscall_resolve_num_arch(SCMP_ARCH_NATIVE, number), &std::free);
  return name != nullptr ? std::string(name.get()) : "number " + std::to_string(number);
}

}  // namespace accounts
