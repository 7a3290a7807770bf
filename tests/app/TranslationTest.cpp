#include "ProgramTest.h"

#include <fstream>
#include <regex>

/// The real program in a process of its own, in an environment that each test makes: the language is chosen once, at
/// the start.
class TranslationTest : public ProgramTest
{
protected:
    Outcome Speak(std::string const & environment, std::string const & arguments) const
    {
        return Shell("cd '" + m_Folder.string() + "' && env -u LC_ALL -u LC_MESSAGES -u LANG -u LANGUAGE " +
                     environment + " '" KORVANE_BINARY_FOLDER "/src/app/korvane' " + arguments);
    }

    Outcome German(std::string const & arguments) const { return Speak("LANG=de_DE.UTF-8", arguments); }
};

TEST_F(TranslationTest, TheEnvironmentChoosesTheLanguageWhateverLocalesTheSystemHas)
{
    struct Case
    {
        char const * m_Environment;
        bool m_IsGerman;
    };
    for (auto const & [environment, isGerman] : {
             Case{"LANG=de_DE.UTF-8", true},
             Case{"LANG=de_AT", true},
             Case{"LC_MESSAGES=de LANG=en_GB.UTF-8", true},
             Case{"LC_ALL=de_DE.UTF-8 LANG=C", true},
             Case{"LANG=en_GB.UTF-8 LANGUAGE=fr:de", true},
             Case{"LANG=C.UTF-8 LANGUAGE=de", true},
             Case{"LC_ALL=C LANG=de_DE.UTF-8", false},
             Case{"LANG=fr_FR.UTF-8", false},
             Case{"LANG=xx_YY.nonsense", false},
             Case{"LANG=", false},
         }) {
        auto const outcome = Speak(environment, "show gone.kvdoc");
        EXPECT_EQ(outcome.m_Code, 1);
        EXPECT_EQ(outcome.m_Out, isGerman ? "gone.kvdoc: Fehler: Eine solche Datei gibt es nicht.\n"
                                          : "gone.kvdoc: error: There is no such file.\n")
            << environment;
    }
}

TEST_F(TranslationTest, CountsValuesAndTheTextsOfTheLibrarySpeakGermanAndMachinesHearTheSame)
{
    Write("one.md", "# Eins\n\nText.\n");
    Write("two.md", "# Zwei\n\nText.\n");
    ASSERT_EQ(Run({"import", "@one.md", "@two.md", "-o", "@docs"}).m_Code, 0);
    struct Case
    {
        char const * m_Why;
        char const * m_Arguments;
        std::vector<std::string> m_Says;
    };
    for (auto const & [why, arguments, says] : std::vector<Case>{
             {"numbered placeholder", "new b docs/one.kvdoc", {"Kapitel 1 (one) hinzugefügt."}},
             {"a table", "status b.kvbook", {"Nr.  Kapitel", "1 Kapitel, 2 Seiten\n", "gut"}},
             {"the singular's own form", "key b.kvbook 9", {"Es gibt kein Kapitel 9. Das Buch hat 1 Kapitel.\n"}},
             {"a step's name comes from the command", "add b.kvbook docs/two.kvdoc", {"Nummern aktualisieren..."}},
             {"plural", "status b.kvbook", {"2 Kapitel, 4 Seiten\n"}},
             {"values out of order", "export b.kvbook -o b.pdf", {"b.pdf geschrieben: 4 Seiten"}},
             {"the plural's own form",
              "key b.kvbook 9",
              {"Es gibt kein Kapitel 9. Das Buch hat 2 Kapitel, gezählt ab 1."}},
             {"help", "move --help", {"Aufruf: korvane move [OPTIONEN]", "Beispiel:", "Ans Ende des Buches"}},
             {"a book to name", "status", {"BOOK wird gebraucht.", "Mehr dazu mit --help."}},
             {"an unknown verb", "bind", {"Ein Verb „bind“ gibt es nicht."}},
             {"too much", "build a b --c", {"Das gehört nicht hierher: b --c"}},
             {"a missing value", "build a -o", {"--output: Dahinter wird ein Wert (OUT.pdf) gebraucht."}},
             {"an empty value", "build a -o ''", {"--output: Hier wird ein Wert gebraucht, der nicht leer ist."}},
             {"given twice", "build a -o x -o y", {"--output darf nur einmal angegeben werden."}},
             {"one of two", "move b.kvbook 1", {"Entweder --before oder --end wird gebraucht."}},
             {"not both", "move b.kvbook 1 --end --before 2", {"--before und --end vertragen sich nicht."}},
             {"excluded", "plan b.kvbook --spreads --layout nup", {"vertragen sich nicht."}},
             {"no number", "export b.kvbook -o x.pdf --fixed-time x", {"„x“ ist keine ganze Zahl ab 0."}},
             {"out of range", "print b.kvbook -o x.pdf --layout nup --rows 0", {"„0“ ist keine ganze Zahl von 1 bis 100000."}},
             {"another word", "status b.kvbook --colour red", {"„red“ ist keins von auto, always, never."}},
             {"a value of the user's language", "set b.kvbook --links nein", {"links", "nein"}},
         }) {
        auto const outcome = German(arguments);
        for (std::string const & text : says) {
            EXPECT_NE(outcome.m_Out.find(text), std::string::npos) << why << ": " << text << " is not in\n"
                                                                   << outcome.m_Out;
        }
    }
    // What a picture's reader says is part of the sentence; the document keeps it in the language of its texts.
    Write("pictures/p.md", "# P\n\n![](b.png)\n\n![](b.svg)\n");
    Write("pictures/b.png", "\x89PNG\r\n\x1a\n");
    Write("pictures/b.svg", "<svg xmlns='http://www.w3.org/2000/svg'/><");
    auto const pictures = German("build pictures -o p.pdf").m_Out;
    EXPECT_NE(pictures.find("Das Bild b.png kann nicht eingesetzt werden: es endet zu früh;"), std::string::npos)
        << pictures;
    EXPECT_NE(pictures.find("Das Bild b.svg kann nicht eingesetzt werden: es ist beschädigt ("), std::string::npos)
        << pictures;
    EXPECT_EQ(
        Shell("cd '" + m_Folder.string() + "' && pdftotext p.pdf - | tr '\n' ' ' | grep -o 'it ends too early'").m_Out,
        "it ends too early\n");
    auto const full = German("export b.kvbook --no-update -q -o /dev/full").m_Out +
                      German("print b.kvbook --no-update -q -o /dev/full").m_Out;
    EXPECT_EQ(full.find('?'), std::string::npos) << "the system's sentence has lost its umlauts: " << full;
    EXPECT_EQ(nlohmann::json::parse(German("show b.kvbook --json").m_Out),
              nlohmann::json::parse(Speak("LANG=C", "show b.kvbook --json").m_Out));
    auto const json = nlohmann::json::parse(German("status b.kvbook --json").m_Out);
    EXPECT_EQ(json["chapters"][0]["status"], "ok");
}

TEST_F(TranslationTest, EveryTextOfTheSourcesHasATranslation)
{
    auto const outcome = Shell(KORVANE_SOURCE_FOLDER "/scripts/translations check");
    EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Out;
}

TEST_F(TranslationTest, TextsStandWhereTheToolsFindThem)
{
    // xgettext reads calls: LocalisedString("text", "context"). Braces and named objects hide a text from translators.
    std::regex const hidden(R"(LocalisedString( const)? [a-z]\w*\(|LocalisedString\(\s*[^")\s]|return \{"[^"]+", ")");
    // What hands both on as they came.
    std::regex const own(R"(LocalisedString\(text, context\))");
    for (auto const & entry : std::filesystem::recursive_directory_iterator(KORVANE_SOURCE_FOLDER "/src")) {
        // The class itself speaks of its arguments.
        if ("LocalisedString.h" == entry.path().filename()) {
            continue;
        }
        if (".cpp" != entry.path().extension() && ".h" != entry.path().extension()) {
            continue;
        }
        std::ifstream stream(entry.path());
        int number = 0;
        for (std::string line; std::getline(stream, line);) {
            ++number;
            EXPECT_FALSE(std::regex_search(line, hidden) && !std::regex_search(line, own))
                << entry.path().string() << ':' << number << ": write Kernel::LocalisedString(\"text\", \"context\"):\n"
                << line;
        }
    }
}
