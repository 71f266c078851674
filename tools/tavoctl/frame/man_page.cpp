// The man page, written from what the verbs declare.
#include "frame/program.h"

#include <cctype>
#include <cerrno>
#include <fstream>

namespace tavoctl {
namespace {

constexpr std::string_view head = R"(.TH TAVOCTL 1 "" "tavoctl )" TAVOCTL_VERSION R"(" "Appliance administration"
.SH NAME
tavoctl \- read and change the state of the appliance
.SH SYNOPSIS
.B tavoctl
.I FAMILY VERB
[\fIOPTION\fR]... [\fIARGUMENT\fR]...
.SH DESCRIPTION
Verbs that read print an aligned table, or the same facts as JSON with \fB\-\-json\fR.
Verbs that change something are silent when they succeed; with \fB\-\-json\fR they print what was changed.
On a machine without \fI/etc.defaults/tavoinfo.conf\fR they refuse, unless \fB\-\-force\-host\fR was given.
A failure is one line on standard error: what was attempted, why it failed, and a hint;
\fB\-\-verbose\fR adds where in the library it arose.
Control characters in values are shown as \fB\\xNN\fR.
An argument that begins with a dash goes after \fB\-\-\fR.
)";

constexpr std::string_view tail = R"(.SH EXIT STATUS
.TP
.B 0
done
.TP
.B 1
failed
.TP
.B 2
the command line or an argument is wrong
.TP
.B 3
the object is not there
.TP
.B 4
somebody else holds the lock or the device; trying again may help
.TP
.B 5
permission denied
.PP
\fBlock run\fR and \fBproc run\fR give the exit status of the program that they ran;
\fBlock run\fR gives 126 when it cannot be executed, 127 when it is not there, and 128 plus the number of the signal that
ended it.
.SH FILES
.TP
.I /etc/tavoinfo.conf
the system settings
.TP
.I /etc.defaults/tavoinfo.conf
the factory settings, with the capabilities and limits of the model
.TP
.I /tmp/lock/lock_*
the locks
)";

std::string Escaped(std::string_view text)
{
    std::string escaped;
    bool begin = true;
    for (const char c : text) {
        if (begin && (c == '.' || c == '\''))
            escaped += "\\&";
        if (c == '-')
            escaped += "\\-";
        else if (c == '\\')
            escaped += "\\e";
        else
            escaped += c;
        begin = c == '\n';
    }
    return escaped;
}

std::string VerbText(const Family &family, const VerbEntry &entry)
{
    const ReadyVerb verb(family, entry);
    std::string text = ".SS \"" + Escaped(verb.Declared().Usage()) + "\"\n" + Escaped(entry.purpose) + "\n";
    for (const bool positional : {true, false}) {
        for (const ArgumentText &argument : verb.Declared().Texts()) {
            if (argument.positional != positional)
                continue;
            text += ".TP\n";
            text += positional ? "\\fI" + Escaped(argument.name) + "\\fR" : "\\fB" + Escaped(argument.name) + "\\fR";
            if (!positional && !argument.value.empty())
                text += " \\fI" + Escaped(argument.value) + "\\fR";
            text += "\n" + Escaped(argument.help) + "\n";
        }
    }
    if (!entry.examples.empty())
        text += ".PP\nExamples:\n.PP\n.nf\n.RS\n" + Escaped(entry.examples) + "\n.RE\n.fi\n";
    return text;
}

}  // namespace

std::string ManPage(const Program &program)
{
    std::string page(head);
    for (const auto &family : program.Families()) {
        page += ".SH \"" + Escaped(family->Name()) + "\"\n" + Escaped(family->Purpose()) + ".\n";
        for (const VerbEntry &entry : family->Verbs())
            page += VerbText(*family, entry);
    }
    page += tail;
    return page;
}

std::string ManPage(const Family &family)
{
    std::string name = family.Name();
    for (char &c : name)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    std::string page = ".TH TAVOCTL\\-" + name +
                       " 1 \"\" \"tavoctl " TAVOCTL_VERSION "\" \"Appliance administration\"\n" +
                       ".SH NAME\ntavoctl\\-" + Escaped(family.Name()) + " \\- " + Escaped(family.Purpose()) +
                       "\n.SH SYNOPSIS\n.B tavoctl " + Escaped(family.Name()) +
                       "\n.I VERB\n[\\fIOPTION\\fR]... [\\fIARGUMENT\\fR]...\n.SH VERBS\n";
    for (const VerbEntry &entry : family.Verbs())
        page += VerbText(family, entry);
    return page + ".SH SEE ALSO\n.BR tavoctl (1)\n";
}

void WriteManPages(const Program &program, const std::string &folder)
{
    for (const auto &family : program.Families()) {
        const std::string path = folder + "/tavoctl-" + family->Name() + ".1";
        std::ofstream file(path);
        if (!(file << ManPage(*family)).flush())
            throw SystemFailure("write " + path, errno);
    }
}

}  // namespace tavoctl
