#include "ProgramTest.h"

#include "app/Verbs.h"
#include "framework/render/Qpdf.h"

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

ProgramTest::ProgramTest()
{
    std::string pattern = (fs::temp_directory_path() / "korvane-app-XXXXXX").string();
    m_Folder = mkdtemp(pattern.data());
}

ProgramTest::~ProgramTest()
{
    std::error_code error;
    fs::remove_all(m_Folder, error);
}

ProgramTest::Outcome ProgramTest::Run(std::vector<std::string> arguments) const
{
    for (std::string & argument : arguments) {
        if (argument.starts_with('@')) {
            argument = (m_Folder / argument.substr(1)).string();
        }
    }
    std::ostringstream out;
    std::ostringstream err;
    Outcome outcome;
    outcome.m_Code = App::RunProgram(arguments, out, err, {}, nullptr);
    outcome.m_Out = out.str();
    outcome.m_Err = err.str();
    return outcome;
}

nlohmann::json ProgramTest::RunJson(std::vector<std::string> arguments, int * code) const
{
    arguments.push_back("--json");
    Outcome const outcome = Run(arguments);
    if (code) {
        *code = outcome.m_Code;
    }
    nlohmann::json json = nlohmann::json::parse(outcome.m_Out, nullptr, false);
    EXPECT_FALSE(json.is_discarded()) << outcome.m_Out << outcome.m_Err;
    return json;
}

ProgramTest::Outcome ProgramTest::Shell(std::string const & command)
{
    std::string quoted;
    for (char const c : command) {
        quoted += '\'' == c ? std::string("'\\''") : std::string(1, c);
    }
    Outcome outcome;
    FILE * const pipe = popen(("exec bash -c '" + quoted + "' 2>&1").c_str(), "r");
    char buffer[4096];
    while (std::size_t const count = fread(buffer, 1, sizeof buffer, pipe)) {
        outcome.m_Out.append(buffer, count);
    }
    int const status = pclose(pipe);
    outcome.m_Code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return outcome;
}

void ProgramTest::Write(std::string const & name, std::string const & text) const
{
    fs::create_directories((m_Folder / name).parent_path());
    std::ofstream(m_Folder / name, std::ios::binary) << text;
}

std::string ProgramTest::Read(std::string const & name) const
{
    std::ifstream stream(m_Folder / name, std::ios::binary);
    return {std::istreambuf_iterator<char>(stream), {}};
}

void ProgramTest::WriteBook(int count) const
{
    for (int chapter = 1; chapter <= count; ++chapter) {
        std::string text = "# Chapter " + std::to_string(chapter) + "\n\n";
        for (int paragraph = 0; paragraph < 30; ++paragraph) {
            text += "The wind went round to the north, and the boat that had come in at dusk lay with its keel on the "
                    "sand until the "
                    "tide took it, as it had taken others before and would take them again.\n\n";
        }
        Write("book/" + std::to_string(chapter) + ".md", text);
    }
}

std::map<std::string, std::string> ProgramTest::Documents() const
{
    std::map<std::string, std::string> documents;
    for (auto const & entry : fs::directory_iterator(m_Folder / "book/.korvane")) {
        if (".kvdoc" == entry.path().extension()) {
            std::string const name = entry.path().filename().string();
            documents[name] = std::to_string(fs::last_write_time(entry.path()).time_since_epoch().count()) +
                              Read("book/.korvane/" + name);
        }
    }
    return documents;
}

int CountPages(fs::path const & path)
{
    try {
        QPDF pdf;
        pdf.setSuppressWarnings(true);
        pdf.processFile(path.c_str());
        return static_cast<int>(QPDFPageDocumentHelper(pdf).getAllPages().size());
    } catch (std::exception const &) {
        return -1;
    }
}

testing::AssertionResult IsWholePdf(fs::path const & path)
{
    try {
        QPDF pdf;
        pdf.setSuppressWarnings(true);
        pdf.processFile(path.c_str());
        for (auto & page : QPDFPageDocumentHelper(pdf).getAllPages()) {
            page.getObjectHandle().getPageContents();
        }
        if (pdf.anyWarnings()) {
            return testing::AssertionFailure() << path << ": " << pdf.getWarnings().front().what();
        }
    } catch (std::exception const & error) {
        return testing::AssertionFailure() << path << ": " << error.what();
    }
    return testing::AssertionSuccess();
}
