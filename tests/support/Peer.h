#ifndef KIV_TESTS_PEER_H
#define KIV_TESTS_PEER_H

#include "support/PrivateBus.h"

namespace kiv::test
{

/// Another participant on the bus, with its own connection. It accepts every method call, records it as
/// "/object/path an.interface.Method (signature) (body)", and answers as configured.
class Peer
{
public:
    /// Handles a call and returns the answer, or null for none. Runs on the thread that reads the connection.
    using Answer = std::function<GDBusMessage*(GDBusMessage* call)>;

    /// @param name    well-known name to own; empty for only the unique name
    /// @param answer  none: answers each call without a value
    explicit Peer(const PrivateBus& bus, const std::string& name = "", Answer answer = {});
    Peer(const Peer&) = delete;
    Peer& operator=(const Peer&) = delete;
    ~Peer();

    /// Answers with a body in GVariant's text form, a tuple.
    static Answer Reply(const char* body);
    static Answer Refuse();
    /// Does something and does not answer.
    static Answer InsteadDo(std::function<void()> action);
    /// Leaves the bus and does not answer.
    Answer Leave();
    void Set(Answer answer);

    /// Returns the well-known name if it has one, otherwise the unique name.
    const std::string& Name() const { return name_; }
    /// Takes a well-known name over from its owner.
    void Own(const std::string& name);
    std::vector<std::string> Calls() const;
    /// Returns its connection, for calls by the peer.
    GDBusConnection* Bus() const { return connection_.get(); }
    /// Stops recording calls.
    void Forget();
    /// Leaves the bus; on return no answer is in progress.
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
