#include "bmc/Target.h"

#include "bmc/Bootstrap.h"
#include "bmc/HostInterface.h"

namespace zorva::bmc {

namespace {

/// Where no fingerprint is offered, the certificate is checked against the authorities. A failure that may pass is no
/// reason for that: the fingerprint is asked for again when there is a connection.
Trust trustOf(const agent::BmcConfig& config, const std::shared_ptr<Ipmi>& ipmi) {
  Trust trust{config.caFile, config.fingerprint};
  if (!config.caFile.empty() || !config.fingerprint.empty()) return trust;
  try {
    trust.fingerprint = askForFingerprint(*ipmi);
  } catch (const NotOffered&) {
    return trust;
  } catch (const Failed&) {
    trust.fingerprint.clear();
  }
  trust.currentFingerprint = [ipmi] { return askForFingerprint(*ipmi); };
  return trust;
}

LoginSource loginOf(const agent::BmcConfig& config, const std::string& url, std::shared_ptr<Ipmi> ipmi) {
  if (!config.user.empty()) return loginFromFile(config.user, config.passwordFile);
  const auto account = std::make_shared<BootstrapAccount>(std::move(ipmi));
  try {
    account->prepare();
  } catch (const NotOffered& error) {
    throw NotOffered("the firmware names a Redfish service, " + url + ", and there is no login for it: " +
                     error.what() + "; or give it a login with [bmc] user and password_file");
  }
  return [account](const util::Secret* refused) { return account->login(refused); };
}

}  // namespace

Target findTarget(const agent::BmcConfig& config, const std::string& smbiosTable, std::shared_ptr<Ipmi> ipmi) {
  if (config.file.empty()) throw NotOffered("[bmc] file is not set, so nothing is read");
  if (!config.url.empty()) {
    return {config.url, {config.caFile, config.fingerprint}, loginFromFile(config.user, config.passwordFile)};
  }
  const std::optional<std::string> named = readHostInterface(smbiosTable);
  if (!named) throw NotOffered("no service processor is configured ([bmc] url), and the firmware names none");
  LoginSource login = loginOf(config, *named, ipmi);
  return {*named, trustOf(config, ipmi), std::move(login)};
}

}  // namespace zorva::bmc
