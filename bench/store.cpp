#include "Items.h"
#include "Ratios.h"
#include "TemporaryFolder.h"

#include <DASubscriberStore.h>
#include <sqlite3.h>

namespace kiv::bench
{

namespace
{

constexpr int kStored = 100'000;

void Check(bool isDone, const std::string& what)
{
    if (!isDone)
        throw std::runtime_error("subscriber store: " + what);
}

/// Fills a store with that many subscribers of one event, and with others up to `stored` records. The library makes the store and
/// its first record; one transaction then inserts the others, which is faster.
void Fill(const std::string& path, int wanted, int stored)
{
    g_setenv("KIV_SUBSCRIBERS", path.c_str(), TRUE);
    std::string reason;
    const DASubscription first = {"push", "wanted", {"org.example.Client", "/org/example/Client/0", "org.example.Client"}};
    Check(DASubscriberStore().Add(first, reason) == DASubscriberStore::Outcome::Done, reason);

    sqlite3* opened = nullptr;
    const int code = sqlite3_open(path.c_str(), &opened);
    const std::unique_ptr<sqlite3, int (*)(sqlite3*)> db(opened, sqlite3_close);
    Check(code == SQLITE_OK, sqlite3_errmsg(opened));
    const std::string sql = "WITH RECURSIVE number(n) AS (SELECT 1 UNION ALL SELECT n + 1 FROM number WHERE n + 1 < " +
                            std::to_string(stored) +
                            ") INSERT INTO subscription(kind, key, busname, objectpath, interface) SELECT 'push',"
                            " CASE WHEN n < " +
                            std::to_string(wanted) +
                            " THEN 'wanted' ELSE n % 1000 END, 'org.example.Client', '/org/example/Client/' || n,"
                            " 'org.example.Client' FROM number WHERE n < " +
                            std::to_string(stored);
    Check(sqlite3_exec(opened, sql.c_str(), nullptr, nullptr, nullptr) == SQLITE_OK, sqlite3_errmsg(opened));
}

/// Finds the wanted subscribers in a store repeatedly.
Side Finds(const std::string& path, int wanted, int times)
{
    const auto find = [wanted]
    {
        std::list<_SubscriberInfo> found;
        std::string reason;
        DASubscriberStore().Find("push", "wanted", found, reason);
        Check(found.size() == static_cast<std::size_t>(wanted), "finds " + std::to_string(found.size()) + ' ' + reason);
    };
    const auto open = [path, find]
    {
        g_setenv("KIV_SUBSCRIBERS", path.c_str(), TRUE);
        find(); // opens the store
    };
    return {Times(times, find), open};
}

} // namespace

void MeasureStore(Table& table)
{
    const TemporaryFolder folder;
    for (const int wanted : {1, 100, 10'000})
    {
        const std::string number = std::to_string(wanted);
        const std::string item = "store: find " + number + " of 100,000, against " + number + " of as many";
        const std::string large = folder.File(number + "-of-many"), small = folder.File(number + "-of-as-many");
        Fill(large, wanted, kStored);
        Fill(small, wanted, wanted);
        const int times = 10'000 / wanted / 10 + 1;
        Compare(table, {item, {1.2}, CpuNs, static_cast<double>(times), Finds(large, wanted, times), Finds(small, wanted, times)});
    }
    Compare(table, {"store: find 10,000, against 100 times 100", {1.5}, CpuNs, 1, Finds(folder.File("10000-of-many"), 10'000, 1),
                       Finds(folder.File("100-of-many"), 100, 100)});
}

} // namespace kiv::bench
