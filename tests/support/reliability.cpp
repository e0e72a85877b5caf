#include "reliability.h"

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <sys/wait.h>
#include <unistd.h>

namespace tw {

namespace {

int g_failures = 0;

class FailureCounter : public ::testing::EmptyTestEventListener {
    void OnTestPartResult(const ::testing::TestPartResult &result) override
    {
        if (result.failed())
            ++g_failures;
    }
};

std::string quoted(const std::optional<std::string> &s) { return s ? "'" + *s + "'" : "null"; }

std::string render_array(varray *a)
{
    if (!a)
        return "null";
    std::string out = "[";
    if (a->at->kind == HBYTES) {
        for (const auto &item : host::array_bytes(a))
            out += quoted(item) + " ";
        return out + "]";
    }
    for (void *slot : host::array_slots(a)) {
        const vdynobj *o = static_cast<const vdynobj *>(slot);
        if (!o) {
            out += "null ";
            continue;
        }
        out += "{";
        for (const char *field : {"epicId", "name", "productId", "id"})
            if (host::has_field(o, field))
                out += std::string(field) + "=" + quoted(host::field_bytes(o, field)) + " ";
        for (const char *field : {"online", "unlock"})
            if (host::has_field(o, field)) {
                std::optional<bool> b = host::field_bool(o, field);
                out += std::string(field) + "=" + (b ? (*b ? "true" : "false") : "?") + " ";
            }
        out += "} ";
    }
    return out + "]";
}

std::string render_arg(const host::Arg &a)
{
    switch (a.kind) {
    case HI32: return std::to_string(a.i);
    case HBYTES: return quoted(a.bytes);
    case HARRAY: return render_array(a.array());
    default: return "?";
    }
}

}  // namespace

void count_failures()
{
    static bool listening = false;
    if (!listening) {
        ::testing::UnitTest::GetInstance()->listeners().Append(new FailureCounter);
        listening = true;
    }
}

int failure_count() { return g_failures; }

bool ChildRun::clean() const { return WIFEXITED(status) && WEXITSTATUS(status) == 0; }

std::string ChildRun::describe() const
{
    if (WIFSIGNALED(status))
        return "killed by signal " + std::to_string(WTERMSIG(status));
    return "exit status " + std::to_string(WEXITSTATUS(status));
}

ChildRun run_forked(const std::function<std::string(const std::string &dir)> &body)
{
    ChildRun run;
    int fds[2];
    if (pipe(fds) != 0) {
        ADD_FAILURE() << "pipe";
        return run;
    }
    std::fflush(nullptr);
    pid_t pid = fork();
    if (pid == 0) {
        close(fds[0]);
        int failures_before = g_failures;
        char pattern[] = "/tmp/tarnwick-run-XXXXXX";
        const char *made = mkdtemp(pattern);
        if (!made || chdir(made) != 0)
            std::_Exit(4);
        std::string out = body(made);
        for (size_t at = 0; at < out.size();) {
            ssize_t n = write(fds[1], out.data() + at, out.size() - at);
            if (n <= 0)
                break;
            at += static_cast<size_t>(n);
        }
        close(fds[1]);
        (void)chdir("/");
        std::error_code ignored;
        std::filesystem::remove_all(made, ignored);
        std::fflush(nullptr);
        std::exit(g_failures > failures_before ? 3 : 0);
    }
    close(fds[1]);
    char buffer[4096];
    for (ssize_t n; (n = read(fds[0], buffer, sizeof buffer)) > 0;)
        run.output.append(buffer, static_cast<size_t>(n));
    close(fds[0]);
    waitpid(pid, &run.status, 0);
    return run;
}

std::string render_call(const host::Call &call)
{
    std::string text = "(";
    for (size_t i = 0; i < call.args.size(); ++i)
        text += (i ? ", " : "") + render_arg(call.args[i]);
    return text + ")";
}

std::string show(const Told &told)
{
    std::string out;
    for (const auto &[closure, calls] : told)
        for (const std::string &c : calls)
            out += "  " + closure + c + "\n";
    return out;
}

host::ClosureRef Recorder::closure(const std::string &name, const std::string &signature)
{
    host::ClosureBehaviour b;
    b.on_call = [this, name](const host::Call &call) {
        told[name].push_back(render_call(call));
        for (const host::Arg &a : call.args)
            if (a.bytes)
                heard.insert(*a.bytes);
    };
    return host::make_closure(signature, b);
}

std::string replace_all(std::string text, const std::string &from, const std::string &to)
{
    if (from.empty())
        return text;
    for (size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size()))
        text.replace(at, from.size(), to);
    return text;
}

}  // namespace tw
