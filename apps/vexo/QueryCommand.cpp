#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/MainLoop.h"
#include "apps/vexo/MainThread.h"
#include "apps/vexo/Paths.h"
#include "apps/vexo/Terminal.h"
#include "framework/metadata/MetadataStore.h"
#include "framework/pathwatcher/PathWatcher.h"
#include "framework/queries/LiveQueries.h"
#include "platform/FileManager.h"

namespace vexo {
namespace {

// What went wrong with the folders; empty when they are all there.
Problems missingFolders(const std::vector<std::string>& folders) {
    Problems problems;
    for (const std::string& folder : folders)
        if (platform::services().fileManager.kindOfItemAtPath(folder) != platform::FileKind::directory)
            problems.push_back("there is no folder '" + folder + "'; give existing folders to --in");
    return problems;
}

void print(const std::vector<std::string>& results, OutputFormat format, std::ostream& out) {
    if (format == OutputFormat::text) {
        for (const std::string& path : results)
            out << printable(path) << "\n";
        return;
    }
    Json paths = Json::array();
    for (const std::string& path : results)
        paths.push_back(jsonText(path));
    out << Json{{"results", paths}}.dump() << "\n";
}

// Looks again in the background whenever something happens, and prints changed results on the main thread.
class QueryFollower : public std::enable_shared_from_this<QueryFollower> {
  public:
    QueryFollower(std::shared_ptr<MetadataQuery> query, OutputFormat format, std::ostream& out,
                  MainLoop& loop)
        : query_(std::move(query)), format_(format), out_(out), loop_(loop) {}

    void changed(const std::vector<std::string>& paths) {
        platform::services().dispatcher.asyncInBackground([self = weak_from_this(), paths] {
            if (const auto living = self.lock())
                living->update(paths);
        });
    }

  private:
    void update(const std::vector<std::string>& paths) {
        if (!query_->update(paths, *systemTime()).isEmpty())
            onMainThread(weak_from_this(), [](QueryFollower& living) { living.printResults(); });
    }

    void printResults() {
        if (format_ == OutputFormat::text)
            out_ << "\n";
        print(query_->results(), format_, out_);
        if (!out_.flush())  // nobody reads on
            loop_.end();
    }

    const std::shared_ptr<MetadataQuery> query_;
    const OutputFormat format_;
    std::ostream& out_;
    MainLoop& loop_;
};

void followChanges(Host& host, const std::shared_ptr<MetadataQuery>& query, const QueryOptions& options,
                   std::ostream& out) {
    MainLoop loop;
    const auto follower = std::make_shared<QueryFollower>(query, options.format, out, loop);
    const auto listener = std::make_shared<const ChangeListener>(
        [follower](const std::vector<std::string>& paths) { follower->changed(paths); });
    for (const std::string& folder : options.folders)
        host.pathWatcher().listen(folder, listener);
    // What happened between the gathering and the watching.
    follower->changed(options.folders);
    loop.run(std::nullopt);
}

}  // namespace

Problems runQuery(Host& host, QueryOptions options, std::ostream& out) {
    for (std::string& folder : options.folders)
        folder = absolutePath(folder);
    if (Problems problems = missingFolders(options.folders); !problems.empty())
        return problems;
    const auto query = std::make_shared<MetadataQuery>(
        options.expression, std::make_shared<VXPathList>(options.folders), host.metadata());
    query->gather(*systemTime());
    print(query->results(), options.format, out);
    if (options.watches && out.flush())
        followChanges(host, query, options, out);
    query->cancel();
    return {};
}

}  // namespace vexo
