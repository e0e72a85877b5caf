// The log sink: every message goes to the VM console and is appended to
// "egs.log" in the current directory.
#include "state.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>

enum {
    CONSOLE_BYTES = 4096, // formatted text, terminator included
    CONSOLE_UNITS = 256,  // 16-bit characters printed, terminator included
};

// Decodes one UTF-8 sequence at text[*at]; returns U+FFFD for a malformed one
// (consuming one byte), so that no message is ever lost on the console.
static uint32_t next_code_point(const unsigned char *text, size_t *at)
{
    unsigned char lead = text[*at];
    int extra;
    uint32_t cp;
    if (lead < 0x80) {
        *at += 1;
        return lead;
    } else if (lead >= 0xC2 && lead <= 0xDF) {
        extra = 1;
        cp = lead & 0x1F;
    } else if (lead >= 0xE0 && lead <= 0xEF) {
        extra = 2;
        cp = lead & 0x0F;
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        extra = 3;
        cp = lead & 0x07;
    } else {
        *at += 1;
        return 0xFFFD;
    }
    for (int i = 1; i <= extra; ++i) {
        unsigned char c = text[*at + i];
        if ((c & 0xC0) != 0x80) {
            *at += 1;
            return 0xFFFD;
        }
        cp = (cp << 6) | (c & 0x3F);
    }
    // Overlong forms, surrogates and values past U+10FFFF are not characters.
    if ((extra == 2 && cp < 0x800) || (extra == 3 && (cp < 0x10000 || cp > 0x10FFFF)) || (cp >= 0xD800 && cp <= 0xDFFF)) {
        *at += 1;
        return 0xFFFD;
    }
    *at += extra + 1;
    return cp;
}

// Converts UTF-8 text to the VM's 16-bit characters: at most CONSOLE_UNITS - 1
// units, a character beyond 16 bits as a surrogate pair that is never split,
// always terminated.
static void to_console_units(const char *text, uchar *out)
{
    const unsigned char *bytes = reinterpret_cast<const unsigned char *>(text);
    size_t at = 0;
    int n = 0;
    while (bytes[at]) {
        uint32_t cp = next_code_point(bytes, &at);
        if (cp < 0x10000) {
            if (n + 1 > CONSOLE_UNITS - 1)
                break;
            out[n++] = static_cast<uchar>(cp);
        } else {
            if (n + 2 > CONSOLE_UNITS - 1)
                break;
            cp -= 0x10000;
            out[n++] = static_cast<uchar>(0xD800 + (cp >> 10));
            out[n++] = static_cast<uchar>(0xDC00 + (cp & 0x3FF));
        }
    }
    out[n] = 0;
}

// A message longer than the console buffer is formatted again, whole. Written
// through the stream's buffer it would leave in several writes, between which
// another thread's line could land; in one unbuffered write it stays whole.
static void write_long_message(FILE *file, int length, const char *format, va_list args)
{
    va_list again;
    va_copy(again, args);
    char *whole = length > 0 ? static_cast<char *>(std::malloc(static_cast<size_t>(length) + 1)) : nullptr;
    if (whole && std::vsnprintf(whole, static_cast<size_t>(length) + 1, format, args) == length) {
        std::setvbuf(file, nullptr, _IONBF, 0);
        std::fwrite(whole, 1, static_cast<size_t>(length), file);
    } else {
        std::vfprintf(file, format, again);
    }
    std::free(whole);
    va_end(again);
}

void egs_log(const char *format, ...)
{
    char text[CONSOLE_BYTES];
    va_list args;
    va_start(args, format);
    va_list file_args;
    va_copy(file_args, args);
    int length = std::vsnprintf(text, sizeof text, format, args);
    va_end(args);
    if (length < 0)
        text[0] = 0;

    uchar console[CONSOLE_UNITS];
    to_console_units(text, console);
    hl_sys_print(reinterpret_cast<vbyte *>(console));

    FILE *file = std::fopen("egs.log", "a+");
    if (file) {
        // A message that fitted the buffer is written with one call, so a line
        // reaches the file in one piece even while another thread logs.
        if (length >= 0 && length < CONSOLE_BYTES)
            std::fwrite(text, 1, static_cast<size_t>(length), file);
        else
            write_long_message(file, length, format, file_args);
        std::fclose(file);
    }
    va_end(file_args);
}

void EOS_CALL on_sdk_log(const EOS_LogMessage *message)
{
    if (!message)
        return;
    egs_log("[EGS] [%d] [%s] %s\n", static_cast<int>(message->Level), message->Category ? message->Category : "",
            message->Message ? message->Message : "");
}
