#include "frame/debug_stream.h"

#include <gtest/gtest.h>
#include <mutex>
#include <string>
#include <thread>
#include <utility>
#include <vector>

using Qor::dbg;

namespace {

/// Collects the pieces, from its construction on and again from each listen().
class listener {
public:
    listener() { listen(); }
    ~listener() { Qor::set_debug_sink(nullptr, nullptr); }
    void listen()
    {
        Qor::set_debug_sink(
            [](const char* text, void* context) noexcept {
                auto& self = *static_cast<listener*>(context);
                const std::lock_guard lock(self.mutex_);
                self.pieces_.emplace_back(text);
            },
            this);
    }
    std::vector<std::string> take()
    {
        const std::lock_guard lock(mutex_);
        return std::exchange(pieces_, {});
    }

private:
    std::mutex mutex_;
    std::vector<std::string> pieces_;
};

using pieces = std::vector<std::string>;

TEST(DebugStream, PassesOnAtANewlineOrAt255Characters)
{
    listener sink;
    dbg() << "one " << 2;
    EXPECT_EQ(sink.take(), pieces{});
    dbg() << std::flush << " three\nfour" << std::endl;
    EXPECT_EQ(sink.take(), (pieces{"one 2 three\n", "four\n"}));
    dbg() << std::string(300, 'x');
    EXPECT_EQ(sink.take(), pieces{std::string(255, 'x')});
    dbg() << '\n';
    EXPECT_EQ(sink.take(), pieces{std::string(45, 'x') + '\n'});
    dbg() << std::string(254, 'y') << "\n\n";
    EXPECT_EQ(sink.take(), (pieces{std::string(254, 'y') + '\n', "\n"}));
}

TEST(DebugStream, DropsTextWithoutASink)
{
    dbg() << "to nobody\n";
    listener sink;
    dbg() << "to somebody\n";
    EXPECT_EQ(sink.take(), pieces{"to somebody\n"});
}

TEST(DebugStream, KeepsLinesOfThreadsWholeWhileSinksChange)
{
    listener one, two;
    std::vector<std::thread> writers;
    for (char name = 'a'; name < 'e'; ++name)
        writers.emplace_back([name] {
            for (int line = 0; line < 200; ++line) dbg() << name << std::hex << name << name << '\n';
        });
    for (int i = 0; i < 100; ++i) (i % 2 ? one : two).listen();
    for (auto& writer : writers) writer.join();
    auto all = one.take();
    for (auto& piece : two.take()) all.push_back(piece);
    EXPECT_EQ(all.size(), 800u);
    for (const auto& piece : all)
        EXPECT_TRUE(piece.size() == 4 && piece[0] == piece[1] && piece[1] == piece[2]) << piece;
    one.listen();
    dbg() << 16 << '\n';
    EXPECT_EQ(one.take(), pieces{"16\n"}); // the format state of the others stayed theirs
}

} // namespace
