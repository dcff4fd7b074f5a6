/// @file
/// A subscriber store in a new directory.
#ifndef KIV_TESTS_STORETEST_H
#define KIV_TESTS_STORETEST_H

#include "support/Texts.h"

#include <DASubscribeDataManager.h>
#include <DASubscriberStore.h>
#include <LogControl.h>

#include <unistd.h>

namespace fs = std::filesystem;
using kiv::test::Contents;
using Outcome = DASubscriberStore::Outcome;

struct SubscriberStore : testing::Test
{
    SubscriberStore() { Use("new/directory/subscribers.db"); }
    ~SubscriberStore() override { fs::remove_all(directory); }

    void Use(const std::string& name) { setenv("KIV_SUBSCRIBERS", (directory / name).c_str(), 1); }

    Outcome Add(const char* kind, const std::string& key, const std::string& busname)
    {
        return store.Add({kind, key, {busname, "/org/example/A", "org.example.A"}}, reason);
    }

    /// Returns the appended bus names, a blank after each, and what is logged meanwhile.
    std::string Find(const char* kind, const char* key)
    {
        kiv::platform::StartLog();
        std::list<_SubscriberInfo> found(1);
        std::string text = DASubscribeDataManager().GetSubscriber(kind, key, found) ? "" : "failed: ";
        found.pop_front();
        for (const _SubscriberInfo& subscriber : found)
            text += subscriber.busname + ' ';
        for (const auto& line : kiv::platform::TakeLog())
            text += std::to_string(line.priority) + ' ' + line.tag + ' ' + line.text;
        return text;
    }

    const fs::path directory = mkdtemp((fs::temp_directory_path() / "kiv-store-XXXXXX").string().data());
    DASubscriberStore store;
    std::string reason;
};

#endif
