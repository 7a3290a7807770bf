#pragma once

#include "app/Interruption.h"
#include "framework/kernel/BroadcastNotification.h"

#include <atomic>
#include <filesystem>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

/// A folder of its own for each test, and the program run in it as a user would.
class ProgramTest : public testing::Test
{
protected:
    struct Outcome
    {
        int m_Code = 0;
        std::string m_Out;
        std::string m_Err;
    };

    ProgramTest();
    ~ProgramTest() override;

    /// Runs the program; "@" at the start of an argument stands for the test's folder.
    Outcome Run(std::vector<std::string> arguments) const;
    /// Runs it with --json, and gives what it printed; null with a failure if that is no JSON.
    nlohmann::json RunJson(std::vector<std::string> arguments, int * code = nullptr) const;

    /// Runs a line of bash; both of its streams are the outcome's output.
    static Outcome Shell(std::string const & command);
    /// What calls the real program in such a line.
    static constexpr char const * g_Program = KORVANE_BINARY_FOLDER "/src/app/korvane";

    void Write(std::string const & name, std::string const & text) const;
    [[nodiscard]] std::string Read(std::string const & name) const;
    [[nodiscard]] bool Exists(std::string const & name) const { return std::filesystem::exists(m_Folder / name); }
    /// A book of `count` chapters of some pages each in the folder "book".
    void WriteBook(int count) const;
    /// Names, sizes and contents of the documents in the work folder, to see what a run has touched.
    [[nodiscard]] std::map<std::string, std::string> Documents() const;

    std::filesystem::path m_Folder;
};

/// A user who presses Ctrl-C at the n-th thing that the program tells of.
class ImpatientUser final : public BroadcastNotificationSink
{
public:
    explicit ImpatientUser(int patience) : m_Patience(patience) { BroadcastNotification::RegisterBroadcastSink(this); }
    ~ImpatientUser() override { BroadcastNotification::UnregisterBroadcastSink(this); }

    void Notify(Kernel::Counted<Kernel::Notification>) override
    {
        if (--m_Patience <= 0) {
            App::Interruption::Raise();
        }
    }

private:
    std::atomic<int> m_Patience;
};

/// A PDF that is whole: head, end, and nothing that qpdf complains about.
testing::AssertionResult IsWholePdf(std::filesystem::path const & path);
/// Number of pages, -1 if it is no PDF.
int CountPages(std::filesystem::path const & path);
