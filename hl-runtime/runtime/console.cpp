// hl_sys_print: the VM's console, captured line by line.
#include "internal.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <mutex>

namespace hlrt {

namespace {

struct Console {
    std::mutex lock;
    std::vector<ConsoleLine> lines;
    bool echo = false;
};

Console &console_state()
{
    static Console *c = [] {
        Console *created = new Console;
        const char *env = std::getenv("HLRT_ECHO");
        created->echo = env && std::strcmp(env, "1") == 0;
        return created;
    }();
    return *c;
}

void append_utf8(std::string &out, uint32_t cp)
{
    if (cp < 0x80) {
        out += static_cast<char>(cp);
    } else if (cp < 0x800) {
        out += static_cast<char>(0xC0 | (cp >> 6));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else if (cp < 0x10000) {
        out += static_cast<char>(0xE0 | (cp >> 12));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else {
        out += static_cast<char>(0xF0 | (cp >> 18));
        out += static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    }
}

}  // namespace

std::string utf16_to_utf8(const char16_t *units, size_t count)
{
    std::string out;
    for (size_t i = 0; i < count; ++i) {
        uint32_t u = units[i];
        if (u >= 0xD800 && u < 0xDC00 && i + 1 < count && units[i + 1] >= 0xDC00 && units[i + 1] < 0xE000) {
            uint32_t low = units[++i];
            append_utf8(out, 0x10000 + ((u - 0xD800) << 10) + (low - 0xDC00));
        } else if (u >= 0xD800 && u < 0xE000) {
            append_utf8(out, 0xFFFD);  // unpaired surrogate
        } else {
            append_utf8(out, u);
        }
    }
    return out;
}

std::vector<ConsoleLine> console()
{
    Console &c = console_state();
    std::lock_guard<std::mutex> guard(c.lock);
    return c.lines;
}

std::vector<std::string> console_utf8()
{
    Console &c = console_state();
    std::lock_guard<std::mutex> guard(c.lock);
    std::vector<std::string> out;
    for (const ConsoleLine &line : c.lines)
        out.push_back(line.utf8);
    return out;
}

void clear_console()
{
    Console &c = console_state();
    std::lock_guard<std::mutex> guard(c.lock);
    c.lines.clear();
}

void set_console_echo(bool echo)
{
    Console &c = console_state();
    std::lock_guard<std::mutex> guard(c.lock);
    c.echo = echo;
}

void reset()
{
    clear_console();
    clear_rethrown();
    release_all();
}

}  // namespace hlrt

extern "C" {

// Not declared in hl.h, as in the VM: libraries declare it themselves.
HL_EXPORT void hl_sys_print(vbyte *msg)
{
    const uchar *units = reinterpret_cast<const uchar *>(msg);
    size_t n = 0;
    while (units[n])
        ++n;
    hlrt::ConsoleLine line;
    line.utf16.assign(reinterpret_cast<const char16_t *>(units), n);
    line.utf8 = hlrt::utf16_to_utf8(line.utf16.data(), n);
    hlrt::Console &c = hlrt::console_state();
    std::lock_guard<std::mutex> guard(c.lock);
    if (c.echo) {
        std::printf("%s", line.utf8.c_str());
        std::fflush(stdout);
    }
    c.lines.push_back(std::move(line));
}

}  // extern "C"
