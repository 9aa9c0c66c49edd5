// What the agent's interface headers share: the mark of what libzorvagent.so.1 exports.
#pragma once

#define ZORVA_AGENT_API __attribute__((visibility("default")))
