#include <signal.h>

#include <stdexcept>

#include "tests/soak/Actors.h"
#include "tests/support/RunningProgram.h"

namespace soak {
namespace {

using testing_support::RunningProgram;

class OtherProgram final : public Actor {
  public:
    OtherProgram(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "other programs"; }

    void act() override {
        static constexpr Deed<OtherProgram> deeds[] = {
            {"tree", &OtherProgram::readTree},
            {"tree, killed", &OtherProgram::killWhileReading},
            {"watch", &OtherProgram::watch},
            {"watch, killed", &OtherProgram::killWhileWatching},
        };
        doOneOf(*this, deeds);
    }

  private:
    // Of a program that says why. A crash and what the sanitizers find have others.
    static constexpr int ordinaryFailure = 1;

    RunningProgram vexo(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(),
                         {"--home", places_.home, "--plugin", REELIX_BUNDLE_DIR, "--quiet"});
        return {VEXO_BIN_DIR "/vexo", std::move(arguments)};
    }
    bool ends(RunningProgram& program) {
        while (program.nextLine()) {
        }
        const int status = program.wait();
        if (status != 0 && status != ordinaryFailure)
            throw std::runtime_error("vexo ended with status " + std::to_string(status));
        if (status != 0)
            count("FAILED");
        return status == 0;
    }

    bool readTree() {
        RunningProgram program = vexo({"tree", "--json", "--metadata"});
        return ends(program);
    }
    bool killWhileReading() {
        RunningProgram program = vexo({"tree", "--json", "--metadata"});
        program.nextLine();
        program.send(SIGKILL);
        return true;
    }
    bool watch() {
        RunningProgram program = vexo({"watch", "--json"});
        program.nextLine();
        program.send(SIGTERM);
        return ends(program);
    }
    bool killWhileWatching() {
        RunningProgram program = vexo({"watch", "--json"});
        program.nextLine();
        program.send(SIGKILL);
        return true;
    }

    const Places& places_;
};

}  // namespace

ActorRef newOtherProgram(const Places& places, unsigned seed) {
    return std::make_unique<OtherProgram>(places, seed);
}

}  // namespace soak
