// Plays every journey in virtual time: those that are also played live, those that only tests can
// play and, to examine a fault, one that is given as PANEL_JOURNEY=FILE.
#include "Rack.h"

#include <filesystem>

namespace {

const std::filesystem::path source = SOURCE;

std::vector<std::filesystem::path> journeys() {
    std::vector<std::filesystem::path> found;
    for (const std::string folder : {"journeys", "tests/journeys"}) {
        for (const auto &entry : std::filesystem::directory_iterator(source / folder))
            found.push_back(entry.path());
    }
    if (const char *byHand = getenv("PANEL_JOURNEY"))
        found.emplace_back(byHand);
    return found;
}

std::string titleOf(const testing::TestParamInfo<std::filesystem::path> &test) {
    std::string title = test.param.stem();
    std::replace_if(title.begin(), title.end(), [](char c) { return isalnum(c) == 0; }, '_');
    return title;
}

class Journeys : public testing::TestWithParam<std::filesystem::path> {};

} // namespace

TEST_P(Journeys, GoAsTheySay) {
    const std::filesystem::path pictures =
        testing::TempDir() + "/panel-pictures-" + std::to_string(getpid());
    create_directories(pictures);
    const auto journey = readJourney(contents(GetParam()), GetParam().filename());
    EXPECT_TRUE(play(journey, false, pictures).holds) << "see above";
    for (const auto &taken : std::filesystem::directory_iterator(pictures))
        EXPECT_TRUE(contents(taken) == contents(source / "docs/pictures" / taken.path().filename()))
            << taken.path().filename() << " shows something else now; renew the pictures with "
            << "scripts/demo --renew-pictures";
    remove_all(pictures);
}

INSTANTIATE_TEST_SUITE_P(All, Journeys, testing::ValuesIn(journeys()), titleOf);
