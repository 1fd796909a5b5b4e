// The schema kelp of a server's database: what applications write and the server lacks, or means differently.
#pragma once

namespace engine::postgres {

// Made anew where the comment on the schema is another one.
inline constexpr const char* kSchemaVersion = "libkelpci 5";

// Commands, for a connection of a user who may create a schema; what is there already is replaced. Fails as a whole.
extern const char* const kSchemaCommands;

}  // namespace engine::postgres
