// The man page, written from what the verbs declare.
#include "frame/program.h"

#include <string_view>

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
Verbs that change something are silent when they succeed.
On a machine without \fI/etc.defaults/tavoinfo.conf\fR they refuse, unless told \fB\-\-force\-host\fR.
A failure is one line on standard error: what was attempted, the code, where in the library it arose, and a hint.
Control characters in values are shown as \fB\\xNN\fR.
An argument that begins with a dash stands behind \fB\-\-\fR.
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
the command line is wrong, or the library refused an argument
.TP
.B 3
what was asked for is not there
.TP
.B 4
somebody else holds the lock or the device
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
    std::string text = ".SS \"" + Escaped(verb.Declared().Usage()) + "\"\n" + Escaped(entry.info.purpose) + "\n";
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
    if (*entry.info.examples)
        text += ".PP\nExamples:\n.PP\n.nf\n.RS\n" + Escaped(entry.info.examples) + "\n.RE\n.fi\n";
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

}  // namespace tavoctl
