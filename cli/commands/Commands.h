#pragma once

#include "cli/commands/Arguments.h"

// The subcommands. Each does what its arguments say and writes to standard output; each throws Failure where it cannot.

namespace zorva::cli {

void showHost(const Arguments& arguments);
void showTree(const Arguments& arguments);
void listClasses(const Arguments& arguments);
void showGraph(const Arguments& arguments);

void enumerateNames(const Arguments& arguments);
void enumerateInstances(const Arguments& arguments);
void getInstance(const Arguments& arguments);

void showAssociators(const Arguments& arguments);
void showAssociatorNames(const Arguments& arguments);
void showReferences(const Arguments& arguments);
void showReferenceNames(const Arguments& arguments);

void modifyInstance(const Arguments& arguments);
void invokeMethod(const Arguments& arguments);

void initInterfaceFile(const Arguments& arguments);
void showInterfaceFile(const Arguments& arguments);

void showServers(const Arguments& arguments);
void setServers(const Arguments& arguments);
void addServers(const Arguments& arguments);
void removeServers(const Arguments& arguments);
void setDomain(const Arguments& arguments);
void showSuffixes(const Arguments& arguments);
void setSuffixes(const Arguments& arguments);
void addSuffixes(const Arguments& arguments);
void removeSuffixes(const Arguments& arguments);

void showOverlay(const Arguments& arguments);
void clearOverlay(const Arguments& arguments);

void writeCompletion(const Arguments& arguments);
void completeWords(const Arguments& arguments);

}  // namespace zorva::cli
