#ifndef KIV_TESTS_PEER_H
#define KIV_TESTS_PEER_H

#include "support/PrivateBus.h"

namespace kiv::test
{

/// Somebody else on the bus, with a connection of its own: takes every method call on every object and interface, keeps it in
/// one line, "/object/path an.interface.Method (signature) (body)", and answers as it was told to.
class Peer
{
public:
    /// What to do with a call: the answer to give, or null for none. Runs on the thread that reads the connection.
    using Answer = std::function<GDBusMessage*(GDBusMessage* call)>;

    /// @param name    well-known name to own; empty for the unique name alone
    /// @param answer  none: answers each call without a value
    explicit Peer(const PrivateBus& bus, const std::string& name = "", Answer answer = {});
    Peer(const Peer&) = delete;
    Peer& operator=(const Peer&) = delete;
    ~Peer();

    /// Answers with a body in GVariant's text form, a tuple.
    static Answer Reply(const char* body);
    static Answer Refuse();
    /// Does something and gives no answer.
    static Answer InsteadDo(std::function<void()> action);
    /// Leaves the bus without an answer.
    Answer Leave();
    void Set(Answer answer);

    /// The name to call it by: the well-known one, else the unique one.
    const std::string& Name() const { return name_; }
    /// Owns a well-known name from now on, instead of whoever did.
    void Own(const std::string& name);
    std::vector<std::string> Calls() const;
    /// Its connection, for calls of its own.
    GDBusConnection* Bus() const { return connection_.get(); }
    /// Keeps no calls from now on.
    void Forget();
    /// Leaves the bus; no answer is being worked at on return.
    void Close();

private:
    struct State;

    static GDBusMessage* Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer state);

    Connection connection_;
    std::string name_;
    State* state_;
};

} // namespace kiv::test

#endif
