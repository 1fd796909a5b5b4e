// Attributes of session handles. Where there is nothing that an attribute would choose, it is kept, so that
// applications written for it run.
#include "handles/attributes.h"
#include "handles/errors.h"
#include "oci.h"
#include "sessions/session.h"

namespace {

Status GetOpenStatements(Session& session, AttributeValue& value) {
    const std::shared_ptr<Link> link = session.ShareLink();
    value.integer = link ? link->open_statements : 0;
    return {};
}

Status GetSchema(Session& session, AttributeValue& value) {
    std::string schema;
    Status status = session.GetSchema(schema);
    std::string& kept = session.KeptText(OCI_ATTR_CURRENT_SCHEMA);
    value.text = TextOut(session.Env(), schema, kept);
    if (!session.Env().Converts()) value.text = kept = std::move(schema);
    value.converted = true;
    return status;
}
Status SetSchema(Session& session, const AttributeValue& value) {
    std::string schema(value.text);
    Status status = session.UseSchema(schema);
    if (status.Ok()) session.current_schema = std::move(schema);
    return status;
}

// Of another session, for what no engine has: sessions that migrate, and users that stand in for others.
Status TakeSession(Object&, const AttributeValue& value) {
    return !value.pointer || Live<Session>(value.pointer) ? Status() : Error(errors::kBadValue);
}
// An array of texts, which is not read: no engine has roles that a session begins with.
Status TakeRoles(Object&, const AttributeValue&) { return {}; }

using S = Session;
constexpr AttributeRow kRows[] = {
    {OCI_ATTR_USERNAME, Shape::text, GetText<&S::user>, SetText<&S::user>},
    {OCI_ATTR_PASSWORD, Shape::text, nullptr, SetText<&S::password>},
    {OCI_ATTR_NUM_OPEN_STMTS, Shape::ub4, Get<S, GetOpenStatements>, nullptr},
    {OCI_ATTR_CLIENT_IDENTIFIER, Shape::text, nullptr, SetText<&S::client_identifier>},
    {OCI_ATTR_MODULE, Shape::text, nullptr, SetText<&S::module>},
    {OCI_ATTR_ACTION, Shape::text, nullptr, SetText<&S::action>},
    {OCI_ATTR_CLIENT_INFO, Shape::text, nullptr, SetText<&S::client_info>},
    {OCI_ATTR_DRIVER_NAME, Shape::text, nullptr, SetText<&S::driver_name>},
    {OCI_ATTR_CONNECTION_CLASS, Shape::text, GetText<&S::connection_class>, SetText<&S::connection_class>},
    {OCI_ATTR_CURRENT_SCHEMA, Shape::text, Get<S, GetSchema>, Set<S, SetSchema>},
    {OCI_ATTR_EDITION, Shape::text, GetText<&S::edition>, SetText<&S::edition>},
    {OCI_ATTR_PURITY, Shape::ub4, GetField<&S::purity>, SetField<&S::purity>},
    {OCI_ATTR_MIGSESSION, Shape::handle, nullptr, TakeSession},
    {OCI_ATTR_PROXY_CREDENTIALS, Shape::handle, nullptr, TakeSession},
    {OCI_ATTR_INITIAL_CLIENT_ROLES, Shape::handle, nullptr, TakeRoles},
};

}  // namespace

std::span<const AttributeRow> Session::Attributes() const { return kRows; }
