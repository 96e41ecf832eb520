#pragma once

#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "tests/platform-linux/BusObject.h"
#include "tests/platform-linux/BusThread.h"

namespace ventras {

/// A transaction of FakePackageKit's, for a test that plays it itself; on the service's thread.
class FakeTransaction {
public:
    FakeTransaction(GDBusConnection* connection, const std::string& path, BusObject::Calls calls);

    void package(unsigned info, const std::string& id);
    void error(unsigned code, const std::string& text = "because");
    void licence(const std::string& id, const std::string& vendor, const std::string& text);
    void progress(unsigned percent);
    void forbidCancel();
    void finish(unsigned exit);

    const BusObject& object() const { return object_; }

private:
    bool allowsCancel_ = true;
    BusObject object_;
};

/// PackageKit over packages in memory, on the system bus of the environment: for what the real one cannot be
/// made to do. What a test does not play itself goes well.
class FakePackageKit {
public:
    /// What becomes of a call: "Resolve", "Simulate", "Install", "Remove", "AcceptEula" or "Cancel".
    using Play = std::function<void(FakeTransaction&)>;
    using Plays = std::map<std::string, Play>;

    /// @param packages names of packages that there are; one that begins with "+" is installed
    explicit FakePackageKit(std::vector<std::string> packages, Plays plays = {});

    /// What was called, in order: "Resolve laser-driver", "Install laser-driver;1.0;all;repository".
    std::vector<std::string> calls();

    /// Whether any was.
    bool was(const std::string& call);

    bool isInstalled(const std::string& package);

    /// Releases the name, while a transaction may be running.
    void goAway();

private:
    void onCall(FakeTransaction& transaction, const std::string& method, GVariant* arguments);
    void goWell(FakeTransaction& transaction, const std::string& call, const std::vector<std::string>& items,
                bool onlyInstalled);
    void offer(GDBusConnection* connection);

    std::mutex mutex_;
    std::map<std::string, bool> packages_;  // to whether they are installed
    Plays plays_;
    std::vector<std::string> calls_;
    GDBusConnection* connection_ = nullptr;
    std::unique_ptr<BusObject> service_;
    std::vector<std::unique_ptr<FakeTransaction>> transactions_;
    BusThread thread_;
};

}  // namespace ventras
