#include "broker/Attachment.h"

#include <algorithm>

namespace tvx::host {

CMPIContext* Core::prepareAttach(const CMPIContext* context) {
  const ContextObject* source = ContextObject::from(context, "prepareAttachThread");
  if (source == nullptr) {
    return nullptr;
  }
  auto attachment = std::make_unique<Attachment>(*this);
  {
    const ScopeGuard guard(attachment->scope);
    attachment->context = makeContext(*this, source->contents.entries, Origin::HandedOut);
  }
  const std::lock_guard lock(m_Mutex);
  m_Attachments.push_back(std::move(attachment));
  return m_Attachments.back()->context;
}

CMPIStatus Core::attach(const CMPIContext* context) {
  if (!m_Options.attaches) {
    return status(CMPI_RC_OK);
  }
  const std::lock_guard lock(m_Mutex);
  for (const auto& attachment : m_Attachments) {
    if (attachment->context == context) {
      pushScope(attachment->scope);
      return status(CMPI_RC_OK);
    }
  }
  return status(CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIStatus Core::detach(const CMPIContext* context) {
  std::unique_ptr<Attachment> ended;
  {
    const std::lock_guard lock(m_Mutex);
    const auto found = std::find_if(m_Attachments.begin(), m_Attachments.end(),
                                    [&](const auto& each) { return each->context == context; });
    if (found == m_Attachments.end()) {
      return status(CMPI_RC_ERR_INVALID_HANDLE);
    }
    ended = std::move(*found);
    m_Attachments.erase(found);
  }
  const bool attached = !m_Options.attaches || popScope(ended->scope);
  ScopeReport report = ended->scope.end();
  if (!attached) {
    report.complaints.emplace_back("detached on a thread that was not attached");
  }
  const std::lock_guard lock(m_Mutex);
  m_ThreadReports.push_back(std::move(report));
  return status(attached ? CMPI_RC_OK : CMPI_RC_ERR_FAILED);
}

std::size_t Core::openAttachments() const {
  const std::lock_guard lock(m_Mutex);
  return m_Attachments.size();
}

std::vector<ScopeReport> Core::threadReports() const {
  const std::lock_guard lock(m_Mutex);
  return m_ThreadReports;
}

}  // namespace tvx::host
