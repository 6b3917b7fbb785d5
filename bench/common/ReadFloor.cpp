#include "ReadFloor.h"

#include "BenchReport.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QDir>

#include <cstdio>
#include <filesystem>
#include <string>
#include <vector>

namespace Brimvault::ReadFloor {

namespace {

namespace fs = std::filesystem;

struct Plan {
    std::vector<fs::path> folders; // listed
    std::vector<fs::path> icons; // read, by name: the window goes to each by its key, it does not list them
    fs::path settings;
};

fs::path pathOf(const QString& path)
{
    return fs::path(QDir::cleanPath(path).toStdString());
}

Plan planFor(const QString& addedRoot)
{
    Plan plan;
    std::error_code error;
    for (const QString& root : {DataFolders::GamesFolder(), addedRoot}) {
        const fs::path top = pathOf(root);
        plan.folders.push_back(top);
        for (fs::recursive_directory_iterator it(top, error), end; !error && it != end; it.increment(error)) {
            if (it->is_directory())
                plan.folders.push_back(it->path());
        }
    }
    for (fs::directory_iterator it(pathOf(DataFolders::IconsFolder()), error), end; !error && it != end;
         it.increment(error))
        plan.icons.push_back(it->path());
    plan.settings = pathOf(SettingsFilePath(AppTitle()));
    return plan;
}

bool readWhole(const fs::path& file, std::vector<char>& buffer)
{
    std::FILE* stream = std::fopen(file.c_str(), "rb");
    if (!stream)
        return false;
    while (std::fread(buffer.data(), 1, buffer.size(), stream) == buffer.size()) { }
    const bool ok = !std::ferror(stream);
    std::fclose(stream);
    return ok;
}

bool pass(const Plan& plan)
{
    std::vector<char> buffer(64 * 1024);
    std::error_code error;
    bool ok = readWhole(plan.settings, buffer);
    for (const fs::path& folder : plan.folders) {
        for (fs::directory_iterator it(folder, error), end; !error && it != end; it.increment(error)) {
            if (it->path().extension() == ".bvxinf")
                ok = readWhole(it->path(), buffer) && ok;
        }
        ok = ok && !error;
    }
    for (const fs::path& icon : plan.icons)
        ok = readWhole(icon, buffer) && ok;
    return ok;
}

} // namespace

double milliseconds(const QString& addedRoot, int runs)
{
    const Plan plan = planFor(addedRoot);
    bool ok = pass(plan); // the same warm cache the window meets on its second fill
    const double elapsed = BenchReport::medianMilliseconds(runs, [&] { ok = pass(plan) && ok; });
    return ok ? elapsed : -1;
}

} // namespace Brimvault::ReadFloor
