#include <filesystem>

#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;

class ProjectEditor final : public Actor {
  public:
    ProjectEditor(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "projects"; }

    void act() override {
        static constexpr Deed<ProjectEditor> deeds[] = {
            {"make", &ProjectEditor::make},         {"make", &ProjectEditor::make},
            {"document", &ProjectEditor::document}, {"cut document", &ProjectEditor::cutDocument},
            {"render", &ProjectEditor::render},     {"render", &ProjectEditor::render},
            {"unrender", &ProjectEditor::unrender}, {"rename", &ProjectEditor::rename},
            {"move out", &ProjectEditor::moveOut},  {"move in", &ProjectEditor::moveIn},
            {"delete", &ProjectEditor::remove},     {"folder", &ProjectEditor::moveFolder},
        };
        doOneOf(*this, deeds);
    }

  private:
    std::string project() { return projectIn(places_.projects, chance); }
    std::string outside() { return projectIn(places_.outside, chance); }
    std::string movie() { return project() + "/Movies/" + std::to_string(chance.below(3)) + ".mov"; }

    bool make() {
        std::error_code failed;
        const std::string made = project();
        return fs::create_directories(made + "/Movies", failed) &&
               copyOver(sampleDocument(chance), made + "/Project");
    }
    bool document() { return copyOver(sampleDocument(chance), project() + "/Project"); }
    bool cutDocument() {
        std::error_code failed;
        fs::resize_file(project() + "/Project", chance.below(600), failed);
        return !failed;
    }
    bool render() { return copyOver(sampleMovie(chance), movie()); }
    bool unrender() {
        std::error_code failed;
        return fs::remove(movie(), failed);
    }
    static bool move(const std::string& from, const std::string& to) {
        std::error_code failed;
        fs::rename(from, to, failed);
        return !failed;
    }
    bool rename() { return move(project(), project()); }
    bool moveOut() { return move(project(), outside()); }
    bool moveIn() { return move(outside(), project()); }
    bool moveFolder() {
        std::error_code failed;
        const bool isOut = fs::exists(places_.outside + "/Folder", failed);
        const std::string here = places_.projects + "/Folder", there = places_.outside + "/Folder";
        return isOut ? move(there, here) : move(here, there);
    }
    bool remove() {
        std::error_code failed;
        return fs::remove_all(project(), failed) > 0 && !failed;
    }

    const Places& places_;
};

}  // namespace

ActorRef newProjectEditor(const Places& places, unsigned seed) {
    return std::make_unique<ProjectEditor>(places, seed);
}

}  // namespace soak
