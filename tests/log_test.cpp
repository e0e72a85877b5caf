// The log sink: the console copy (cut to 255 16-bit characters), the file copy
// (whole), and SDK log lines routed through it.
#include "tarnwick_test.h"

#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

using namespace tw;

class Log : public TarnwickTest {
protected:
    std::string file() const
    {
        std::ifstream in(dir_ + "/egs.log", std::ios::binary);
        std::stringstream s;
        s << in.rdbuf();
        return s.str();
    }
    void start() { ASSERT_TRUE(init(config(), nullptr)); }
    // The console line printed for an SDK message.
    std::u16string console_of(const std::string &needle)
    {
        for (const hlrt::ConsoleLine &line : hlrt::console())
            if (line.utf8.find(needle) != std::string::npos)
                return line.utf16;
        ADD_FAILURE() << "no console line with " << needle;
        return {};
    }
};

TEST_F(Log, TheFirstLineIsAppendedExactlyAndLaterLinesFollowInOrder)
{
    std::ofstream(dir_ + "/egs.log") << "earlier content\n";
    start();
    std::string text = file();
    EXPECT_EQ(text.rfind("earlier content\n[EGS] DEBUG BUILD\n", 0), 0u) << text;
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, "Hi");
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Error, "There");
    auto lines = log_lines();
    ASSERT_GE(lines.size(), 2u);
    EXPECT_EQ(lines[lines.size() - 2], "[EGS] [300] [LogEOS] Hi");
    EXPECT_EQ(lines.back(), "[EGS] [200] [LogEOS] There");
    EXPECT_EQ(hlrt::console_utf8().back(), "[EGS] [200] [LogEOS] There\n");
}

TEST_F(Log, SdkTextIsNeverAFormatAndLevelsBeyondInfoAreNotAskedFor)
{
    start();
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Lobby, EOS_ELogLevel::EOS_LOG_Info, "100%s done %d %n");
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Lobby, EOS_ELogLevel::EOS_LOG_Verbose, "chatter");
    EXPECT_EQ(log_lines().back(), "[EGS] [400] [LogEOSLobby] 100%s done %d %n");
    EXPECT_TRUE(log_lines_with("chatter").empty());
}

TEST_F(Log, LongMessagesAreCutOnTheConsoleOnlyAndWholeInTheFile)
{
    start();
    std::string long_text(300 - 21, 'x');  // "[EGS] [300] [LogEOS] " is 21 characters
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, long_text);
    std::u16string console = console_of("xxxx");
    EXPECT_EQ(console.size(), 255u);
    EXPECT_EQ(log_lines().back(), "[EGS] [300] [LogEOS] " + long_text);

    // Past the 4095 characters the console buffer holds, the file still has
    // the whole message.
    std::string huge(5000, 'y');
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, huge);
    EXPECT_EQ(console_of("yyyy").size(), 255u);
    EXPECT_EQ(log_lines().back(), "[EGS] [300] [LogEOS] " + huge);
}

TEST_F(Log, TextIsConvertedToSixteenBitCharactersWithoutSplittingAPair)
{
    start();
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, "caf\xC3\xA9 \xF0\x9F\x98\x80 \xFF!");
    std::u16string line = console_of("caf");
    EXPECT_EQ(line, u"[EGS] [300] [LogEOS] caf\u00e9 \U0001F600 \uFFFD!\n");

    // 233 + 21 = 254 units, then a character needing two: it does not fit.
    std::string text = std::string(233, 'z') + "\xF0\x9F\x98\x80" + "tail";
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, text);
    std::u16string cut = console_of("zzzz");
    EXPECT_EQ(cut.size(), 254u);
    EXPECT_EQ(cut.back(), u'z');
    EXPECT_EQ(log_lines().back(), "[EGS] [300] [LogEOS] " + text);
}

TEST_F(Log, AnUnwritableLogFileLeavesTheConsoleAndTheLibraryWorking)
{
    std::filesystem::create_directory(dir_ + "/egs.log");
    host::ClosureRef onLogin = host::make_closure("PiBBB_v");
    ASSERT_TRUE(init(config(), onLogin));
    ASSERT_TRUE(tick_until([&] { return onLogin->count() > 0; }));
    EXPECT_EQ(arg_i32(onLogin->last(), 0), 0);
    auto console = hlrt::console_utf8();
    EXPECT_NE(std::find(console.begin(), console.end(), "[EGS] DEBUG BUILD\n"), console.end());
    EXPECT_NE(std::find(console.begin(), console.end(), "[EGS] EGS Connect Login success\n"), console.end());

    // The next message tries the file again.
    std::filesystem::remove(dir_ + "/egs.log");
    eos_sim::emit_log(EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, "back");
    EXPECT_EQ(log_lines(), std::vector<std::string>{"[EGS] [300] [LogEOS] back"});
}

TEST_F(Log, LinesFromAnotherThreadNeverInterleaveWithTheGamesLines)
{
    start();
    const std::string sdk_text(180, 's');
    std::thread sdk([&] {
        eos_sim::emit_log_from_thread(300, EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, sdk_text);
    });
    for (int i = 0; i < 300; ++i)
        p.leave_lobby(host::bytes("lobby-that-is-not-there"), nullptr);
    tick(5);
    sdk.join();
    size_t sdk_lines = 0;
    size_t game_lines = 0;
    for (const std::string &line : log_lines()) {
        if (line.find("sss") != std::string::npos) {
            EXPECT_EQ(line, "[EGS] [300] [LogEOS] " + sdk_text);
            ++sdk_lines;
        } else if (line.rfind("[EGS] Can't leave lobby", 0) == 0) {
            ++game_lines;
        }
    }
    EXPECT_EQ(sdk_lines, 300u);
    EXPECT_EQ(game_lines, 300u);
}

TEST_F(Log, LinesLongerThanTheConsoleBufferStayWholeUnderAnotherThreadsLines)
{
    start();
    // Past 4095 characters a message is formatted into the file a second
    // time; it must still reach it as one piece.
    const std::string sdk_text(6000, 's');
    const std::string lobby(6000, 'g');
    std::thread sdk([&] {
        eos_sim::emit_log_from_thread(1000, EOS_ELogCategory::EOS_LC_Core, EOS_ELogLevel::EOS_LOG_Warning, sdk_text);
    });
    // The game thread logs while the SDK's thread does: one failed leave a tick.
    for (int i = 0; i < 200; ++i) {
        p.leave_lobby(host::bytes(lobby), nullptr);
        tick(1);
    }
    tick(2);
    sdk.join();
    size_t sdk_lines = 0;
    size_t game_lines = 0;
    for (const std::string &line : log_lines()) {
        if (line.find("sss") != std::string::npos) {
            EXPECT_EQ(line, "[EGS] [300] [LogEOS] " + sdk_text);
            ++sdk_lines;
        } else if (line.rfind("[EGS] Can't leave lobby", 0) == 0) {
            EXPECT_EQ(line.substr(0, 24 + lobby.size()), "[EGS] Can't leave lobby " + lobby);
            ++game_lines;
        }
    }
    EXPECT_EQ(sdk_lines, 1000u);
    EXPECT_EQ(game_lines, 200u);
}
