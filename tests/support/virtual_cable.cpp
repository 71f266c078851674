// Appliances on one virtual cable.
#include "support/virtual_cable.h"

#include "support/test.h"

#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>

namespace test {
namespace {

constexpr int kNamespaces = CLONE_NEWNET | CLONE_NEWUTS | CLONE_NEWNS | CLONE_NEWPID;

int StatusOf(pid_t pid)
{
    int status = 0;
    while (::waitpid(pid, &status, 0) < 0 && errno == EINTR) {
    }
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

bool MountAnew(const char *type, const char *where, unsigned long flags = 0)
{
    return ::mount(type, where, type, flags, nullptr) == 0;
}

bool Settle(const std::string &host_name)
{
    // A file system of the machine may only be mounted again with the same flags.
    constexpr unsigned long flags = MS_NOSUID | MS_NODEV | MS_NOEXEC;
    if (::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 || !MountAnew("proc", "/proc", flags) ||
        !MountAnew("sysfs", "/sys", flags | MS_RDONLY) || !MountAnew("tmpfs", "/tmp") ||
        !MountAnew("tmpfs", "/var/run") || ::sethostname(host_name.c_str(), host_name.size()) != 0)
        return false;
    ::chmod("/tmp", 01777);
    for (const char *folder : {"/tmp/lock", "/tmp/etc"})
        std::filesystem::create_directory(folder);
    // Its own settings, too.
    return ShellStatus("cp -a /etc/. /tmp/etc/") == 0 && ::mount("/tmp/etc", "/etc", nullptr, MS_BIND, nullptr) == 0 &&
           ShellStatus("ip link set lo up") == 0;
}

// Process 1 of a node: collects orphaned processes.
[[noreturn]] void BecomeInit(const std::string &host_name, int ready)
{
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    const pid_t settled = 0;
    if (!Settle(host_name) || ::write(ready, &settled, sizeof settled) != sizeof settled)
        ::_exit(1);
    ::close(ready);
    for (;;) {
        if (::waitpid(-1, nullptr, 0) < 0)
            ::usleep(20000);
    }
}

[[noreturn]] void BecomeKeeper(const std::string &host_name, int ready)
{
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (::unshare(kNamespaces) != 0)
        ::_exit(1);
    const pid_t init = ::fork();
    if (init == 0)
        BecomeInit(host_name, ready);
    (void)!::write(ready, &init, sizeof init);
    ::close(ready);
    ::_exit(StatusOf(init));
}

[[noreturn]] void BecomeShell(const std::string &command)
{
    ::execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
    ::_exit(127);
}

template <class Body>
int InFork(Body body)
{
    const pid_t pid = ::fork();
    if (pid == 0)
        body();
    return StatusOf(pid);
}

}  // namespace

int ShellStatus(const std::string &command)
{
    return InFork([&] { BecomeShell(command); });
}

Node::Node(const std::string &host_name)
{
    int ready[2];
    EXPECT_EQ(::pipe2(ready, O_CLOEXEC), 0);
    keeper_ = ::fork();
    if (keeper_ == 0)
        BecomeKeeper(host_name, ready[1]);
    ::close(ready[1]);
    // Its process id and the report that it is ready, in either order.
    for (int i = 0; i < 2; ++i) {
        pid_t said = 0;
        EXPECT_EQ(::read(ready[0], &said, sizeof said), static_cast<ssize_t>(sizeof said)) << "no namespaces";
        pid_ = said > 0 ? said : pid_;
    }
    ::close(ready[0]);
}

Node::~Node()
{
    ::kill(pid_, SIGKILL);  // and with it every process there
    ::waitpid(keeper_, nullptr, 0);
}

void Node::Enter() const
{
    const std::string folder = "/proc/" + std::to_string(pid_);
    int fds[4];
    const char *const names[] = {"/ns/net", "/ns/uts", "/ns/pid", "/ns/mnt"};
    for (int i = 0; i < 4; ++i)
        fds[i] = ::open((folder + names[i]).c_str(), O_RDONLY | O_CLOEXEC);
    const int root = ::open((folder + "/root").c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
    for (const int fd : fds) {
        if (::setns(fd, 0) != 0)
            ::_exit(125);
        ::close(fd);
    }
    // Its mounts begin at the machine's root directory, and its own root may be another.
    if (::fchdir(root) != 0 || ::chroot(".") != 0)
        ::_exit(125);
    ::close(root);
    // Only the children are in its process namespace.
    const pid_t pid = ::fork();
    if (pid != 0)
        ::_exit(StatusOf(pid));
}

bool Node::Run(const std::function<bool()> &body) const
{
    return InFork([&] {
               Enter();
               const bool done = body() && !testing::Test::HasFailure();
               std::fflush(nullptr);
               ::_exit(done ? 0 : 1);
           }) == 0;
}

void Node::Do(const std::function<void()> &body) const
{
    EXPECT_TRUE(Run([&] { return body(), true; }));
}

int Node::Shell(const std::string &command) const
{
    return InFork([&] {
        Enter();
        BecomeShell(command);
    });
}

std::string Node::Output(const std::string &command) const
{
    const ScratchDir dir;
    const std::string file = dir / "output";
    InFork([&] {
        const int out = ::open(file.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);  // here, where the test can read it
        ::dup2(out, 1);
        Enter();
        BecomeShell(command);
    });
    return ReadFile(file);
}

VirtualCable::VirtualCable(const std::string &name) : name_(name)
{
    EXPECT_EQ(test::ShellStatus("ip link add " + name_ + " type bridge && ip link set " + name_ + " up"), 0);
}

VirtualCable::~VirtualCable()
{
    for (const std::string &end : ends_)
        test::ShellStatus("ip link del " + end + " 2>/dev/null");
    test::ShellStatus("ip link del " + name_);
}

void VirtualCable::Plug(const Node &node, const std::string &card)
{
    const std::string end = name_ + std::to_string(ends_.size());
    ends_.push_back(end);
    // Not every ip can name the other end of a new pair; it is then veth0.
    const std::string pid = std::to_string(node.Pid());
    EXPECT_EQ(test::ShellStatus("ip link add " + end + " type veth && ip link set veth0 netns " + pid +
                                " && ip link set " + end + " master " + name_ + " && ip link set " + end + " up"),
              0);
    EXPECT_EQ(node.Shell("ip link set veth0 name " + card), 0);
}

std::string VirtualCable::Missing()
{
    for (const char *part : {"net", "uts", "mount", "sys", "setns"}) {
        if (RootLacks(part))
            return std::string("needs namespaces: ") + part;
    }
    if (test::ShellStatus("ip link add probe0 type veth 2>/dev/null && ip link del probe0") != 0)
        return "this kernel makes no veth pairs here";
    return "";
}

}  // namespace test
