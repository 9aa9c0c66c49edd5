#pragma once

// Shared by the agent's interface headers: marks the symbols that libzorvagent.so.1 exports.

#define ZORVA_AGENT_API __attribute__((visibility("default")))
