#include "DriverTestSupport.h"

#include "Generators/RandomProgram.h"
#include "Graph/ProgramGraph.h"
#include "Language/Reader.h"
#include "Seeing/Recorder.h"
#include "Seeing/ReportBoxes.h"
#include "Seeing/ReportLayout.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <map>
#include <set>

namespace {

using namespace hpn;

std::string examplePath() {
    return std::string(HPNSSA_SOURCE_DIR) + "/Examples/cruise_control.hpn";
}

/// Names of elements that are closed in another order than they were opened; scripts and styles
/// are skipped as the browser does.
std::vector<std::string> misplacedTags(const std::string& Page) {
    std::vector<std::string> Open;
    std::vector<std::string> Wrong;
    for (std::size_t At = Page.find('<'); At != std::string::npos; At = Page.find('<', At)) {
        const std::size_t End = Page.find('>', At);
        if (End == std::string::npos)
            return {"an unclosed <"};
        const std::string Tag = Page.substr(At + 1, End - At - 1);
        const std::string Name = Tag.substr(0, Tag.find_first_of(" \n"));
        At = End;
        if (Name[0] == '!' || Tag.back() == '/')
            continue;
        if (Name[0] == '/') {
            if (Open.empty() || Open.back() != Name.substr(1))
                Wrong.push_back(Name);
            else
                Open.pop_back();
            continue;
        }
        Open.push_back(Name);
        if (Name == "script" || Name == "style")
            At = Page.find("</" + Name, At);
    }
    Wrong.insert(Wrong.end(), Open.begin(), Open.end());
    return Wrong;
}

std::map<std::string, nlohmann::json> dataOf(const std::string& Page) {
    std::map<std::string, nlohmann::json> Parts;
    const std::string Mark = "id=\"data-";
    for (std::size_t At = Page.find(Mark); At != std::string::npos; At = Page.find(Mark, At + 1)) {
        const std::size_t Name = At + Mark.size();
        const std::size_t Text = Page.find('>', Name) + 1;
        Parts[Page.substr(Name, Page.find('"', Name) - Name)] =
            nlohmann::json::parse(Page.substr(Text, Page.find("</script>", Text) - Text));
    }
    return Parts;
}

TEST(Report, PageIsWellFormedAndNeedsNothingBesideItself) {
    for (const char* Before : {"", "PATH=/nowhere"}) {
        DriverRun Run;
        ASSERT_EQ(Run.run("--report=page " + examplePath() + " -o out.c", Before), 0)
            << Run.errors();
        ASSERT_EQ(Run.files("page").size(), 1u);
        const std::string Page = Run.read("page/index.html");
        EXPECT_EQ(misplacedTags(Page), std::vector<std::string>());
        for (const char* Foreign : {"http:", "https:", " src=", "@import", "url(http", "@{"})
            EXPECT_EQ(Page.find(Foreign), std::string::npos) << Foreign;

        std::map<std::string, nlohmann::json> Parts = dataOf(Page);
        EXPECT_EQ(Parts["sources"]["rows"][0][1], DriverRun::readFile(examplePath()));
        const std::size_t Snapshots = Parts["snapshots"]["rows"].size();
        EXPECT_EQ(Snapshots, 13u);
        EXPECT_EQ(Parts.count("changes-" + std::to_string(Snapshots - 1)), 1u);
        for (const char* Each : {"variables", "versions", "fates", "saturations", "remarks"})
            EXPECT_FALSE(Parts[Each]["rows"].empty()) << Each;
        EXPECT_EQ(Parts["pictures"]["isGraphvizThere"], *Before == '\0');
        EXPECT_EQ(Parts.count("layout-0"), *Before == '\0' ? 1u : 0u);
        // Every picture has a place for each of its boxes.
        for (const nlohmann::json& Each : Parts["pictures"]["procedures"]) {
            ASSERT_EQ(Each["layout"] == -1, *Before != '\0');
            if (*Before == '\0') {
                EXPECT_EQ(Each["boxes"].size(),
                          Parts["layout-" + Each["layout"].dump()]["boxes"].size());
            }
        }
    }
}

/// Whether the boxes hold each node of the procedure once, and lead wherever its edges lead.
void checkBoxes(const Recording& Of, const RecordedProcedure& Procedure, const ReportBoxes& Made,
                bool AreEdgesKept) {
    std::map<unsigned, int> BoxOf; // by node id
    for (std::size_t i = 0; i < Made.Boxes.size(); ++i) {
        for (const ReportItem& Item : Made.Boxes[i].Items) {
            ASSERT_TRUE(Item.IsFolded || Item.Nodes.size() == 1);
            for (const int Node : Item.Nodes)
                ASSERT_TRUE(
                    BoxOf.emplace(Of.Nodes[static_cast<std::size_t>(Node)].Id, static_cast<int>(i))
                        .second);
        }
    }
    ASSERT_EQ(BoxOf.size(), Procedure.Nodes.size());
    std::set<std::pair<int, int>> Ways;
    for (const ReportBoxEdge& Each : Made.Edges)
        Ways.insert({Each.From, Each.To});
    std::set<std::pair<int, int>> Wanted;
    for (const RecordedEdge& Each : Procedure.Edges) {
        if (Each.What == RecordedEdge::Kind::Ssa)
            continue;
        const std::pair<int, int> Way{BoxOf.at(Each.From), BoxOf.at(Each.To)};
        if (Way.first != Way.second)
            Wanted.insert(Way);
        ASSERT_TRUE(Way.first == Way.second || Ways.count(Way) != 0);
    }
    for (const std::pair<int, int>& Each : Ways)
        ASSERT_TRUE(Each.first == Each.second || Wanted.count(Each) != 0);
    // Parallel ways of a branch stay two.
    EXPECT_TRUE(!AreEdgesKept || Made.Edges.size() >= Wanted.size());
}

TEST(Report, FoldingKeepsEachNodeAndEachWay) {
    FoldingLimits Narrow;
    Narrow.Nodes = 0;
    Narrow.Boxes = 3;
    Narrow.Items = 4;
    std::size_t Before = 0;
    std::size_t After = 0;
    for (std::uint32_t Seed = 1; Seed <= 12; ++Seed) {
        SourceFiles Sources;
        Sources.add("test.hpn", fuzz::RandomProgram(Seed).text());
        Diagnostics Messages(Sources);
        Program Source;
        ASSERT_TRUE(readProgram(Sources, Messages, Source)) << Messages.print();
        ProgramGraph Graph(Source);
        PassRunner Runner(Graph);
        Recorder Watching(Sources);
        Runner.addObserver(Watching);
        ASSERT_TRUE(Runner.run(PassSequence::defaultOrder()));
        const Recording& Whole = Watching.finish();
        for (const RecordedProcedure& Each : Whole.Procedures) {
            const ReportBoxes Plain = makeBoxes(Whole, Each, {}, {});
            checkBoxes(Whole, Each, Plain, true);
            const ReportBoxes Folded = makeBoxes(Whole, Each, {}, Narrow);
            checkBoxes(Whole, Each, Folded, false);
            Before += Plain.Boxes.size();
            After += Folded.Boxes.size();
        }
    }
    EXPECT_LT(After * 2, Before); // it is worth it
}

TEST(Report, PlacesOfABrokenLayoutAreRefused) {
    const std::string Whole = "graph 1 2 2\nnode 0 1 1.5 2 1 \"\" solid box black lightgrey\n"
                              "edge 0 0 2 1 1 1 0.5 solid green\nstop\n";
    PlacedPicture Placed;
    ASSERT_TRUE(readPlain(Whole, 1, Placed));
    EXPECT_EQ(Placed.Boxes[0].Y, 0);
    EXPECT_EQ(Placed.Edges[0].What, 't');
    EXPECT_EQ(Placed.Edges[0].Path, "M72,72C72,108");
    EXPECT_FALSE(readPlain(Whole, 0, Placed)); // a box that nobody ordered
    for (const std::size_t Length :
         {std::size_t{0}, std::size_t{30}, std::size_t{80}, Whole.size() - 5})
        EXPECT_FALSE(readPlain(Whole.substr(0, Length), 1, Placed)) << Length;
}

} // namespace
