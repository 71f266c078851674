// Passwords: from a terminal or from standard input.
#include "frame/password.h"

#include "frame/failure.h"
#include "frame/text.h"

#include <cerrno>
#include <csignal>
#include <cstring>
#include <iterator>

#include <sys/random.h>
#include <termios.h>
#include <unistd.h>

namespace tavoctl {
namespace {

constexpr std::size_t longest = 1024;
constexpr char password_hint[] = "type one, send it as the first line of standard input, or use --empty-password";

termios shown;

// Restores the echo of the terminal when the question is interrupted.
extern "C" void ShowAndDie(int signal)
{
    ::tcsetattr(STDIN_FILENO, TCSAFLUSH, &shown);
    ::signal(signal, SIG_DFL);
    ::raise(signal);
}

// The terminal does not show what is typed.
class Hidden {
  public:
    Hidden()
    {
        ::tcgetattr(STDIN_FILENO, &shown);
        for (std::size_t i = 0; i < std::size(signals); ++i)
            saved_[i] = std::signal(signals[i], ShowAndDie);
        termios hidden = shown;
        hidden.c_lflag &= ~static_cast<tcflag_t>(ECHO);
        ::tcsetattr(STDIN_FILENO, TCSADRAIN, &hidden);
    }
    ~Hidden()
    {
        ::tcsetattr(STDIN_FILENO, TCSADRAIN, &shown);
        for (std::size_t i = 0; i < std::size(signals); ++i)
            std::signal(signals[i], saved_[i]);
    }
    Hidden(const Hidden &) = delete;
    Hidden &operator=(const Hidden &) = delete;

  private:
    static constexpr int signals[] = {SIGINT, SIGQUIT, SIGTERM, SIGHUP};
    void (*saved_[4])(int) = {};
};

void Say(const std::string &text)
{
    const std::string printable = Printable(text, true);
    if (::write(STDERR_FILENO, printable.data(), printable.size()) < 0)
        throw Failure{.attempted = "ask for the password", .reason = std::strerror(errno)};
}

// Reads byte by byte, so that the text after the line stays unread.
std::string ReadLine()
{
    std::string line;
    char c = 0;
    for (;;) {
        const ssize_t count = ::read(STDIN_FILENO, &c, 1);
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            throw Failure{.attempted = "read the password", .reason = std::strerror(errno)};
        if (count == 0 || c == '\n')
            return line;
        RefuseIf(c == '\0' || line.size() == longest, "take the password", "it is too long, or no text");
        line += c;
    }
}

std::string ReadHidden(const std::string &prompt)
{
    std::string line;
    {
        const Hidden hidden;  // before the prompt invites typing
        Say(prompt);
        line = ReadLine();
    }
    Say("\n");
    return line;
}

}  // namespace

std::string AskPassword(const std::string &name)
{
    const bool terminal = ::isatty(STDIN_FILENO) && ::isatty(STDERR_FILENO);
    std::string password = terminal ? ReadHidden("Password of " + name + ": ") : ReadLine();
    RefuseIf(password.empty(), "set the password of " + name, "none was given", password_hint);
    FailIf(terminal && ReadHidden("Again: ") != password, "set the password of " + name, "the two differ");
    return password;
}

std::string UnknownPassword()
{
    unsigned char bytes[32];
    if (::getrandom(bytes, sizeof bytes, 0) != static_cast<ssize_t>(sizeof bytes))
        throw Failure{.attempted = "make a password", .reason = std::strerror(errno)};
    std::string password;
    for (const unsigned char byte : bytes)
        password += "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789+-"[byte % 64];
    return password;
}

PasswordChoice::PasswordChoice(Arguments &in)
    : empty_(in.Flag("--empty-password", "no password: everybody can log in")),
      unknown_(in.Flag("--unknown-password", "a random one: no login is possible until a password is set"))
{
}

std::string PasswordChoice::For(const std::string &name) const
{
    RefuseIf(*empty_ && *unknown_, "choose a password", "--empty-password and --unknown-password exclude each other");
    return *empty_ ? std::string() : *unknown_ ? UnknownPassword() : AskPassword(name);
}

}  // namespace tavoctl
