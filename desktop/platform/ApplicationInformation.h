// What a broadcast signals about applications, read from the application information table (AIT) of
// TS 102 809, as TS 102 796 profiles it for HbbTV.
#ifndef TELIX_DESKTOP_PLATFORM_APPLICATIONINFORMATION_H
#define TELIX_DESKTOP_PLATFORM_APPLICATIONINFORMATION_H

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "desktop/platform/TsTables.h"

namespace desktop {

struct ApplicationId {
    uint32_t organisation = 0;
    uint16_t application = 0;

    bool operator==(const ApplicationId& other) const {
        return organisation == other.organisation && application == other.application;
    }
};

// The control codes that the set supports, with the names of the standard.
struct ControlCode {
    const char* name;
    uint8_t value;
};
const std::vector<ControlCode>& controlCodes();

// Empty if the set does not support the code.
std::string controlCodeName(uint8_t value);

// One application that is signalled.
struct SignalledApplication {
    ApplicationId id;
    uint8_t controlCode = kControlCodeAutostart; // as broadcast: see kControlCodeAutostart
    std::string name;                            // of the first language; UTF-8, empty if there is none
    std::string url;                             // absolute; empty only if the application cannot be started
    std::vector<std::string> boundaries;         // beginnings of further URLs that belong to the application
    bool isServiceBound = false;                 // ends when another service is selected
    uint8_t visibility = kVisibilityAll;
    uint8_t priority = 0; // the highest one starts
    uint8_t usage = kUsageNone;

    // Whether the signalling allows the application to run.
    bool isStartable() const {
        return controlCode == kControlCodeAutostart || controlCode == kControlCodePresent;
    }
};

// The applications of a service or of a document, in the order in which they are signalled.
struct ApplicationList {
    std::vector<SignalledApplication> applications;
    std::vector<std::string> skipped; // per entry or section that was left out: which, and why
};

// Our limit: what goes beyond it is skipped.
constexpr size_t kMaxSignalledApplications = 256;

// "ORG.APP" in hexadecimal, as in dvb://current.ait/ORG.APP.
std::string toString(const ApplicationId& id);

// Appends the applications to `list`. Why the set cannot run an application is the reason for skipping it.
void readApplications(const Ait& ait, ApplicationList& list);

// Whether the set runs applications of this profile and version.
bool isSupported(const ApplicationProfile& profile);

// What keeps an application from the list although it is well-formed; empty if nothing does. For AIT and XML
// AIT alike.
std::string findFault(const SignalledApplication& application);

// Appends an application to the list, or the reason why it is skipped.
void addApplication(SignalledApplication application, const std::string& fault, ApplicationList& list);

// Collects the AIT of HbbTV applications on one PID: its sections, and the changes of its version.
class ApplicationTable {
public:
    // Takes one section with a correct CRC. True if list() is new: all sections of a version are there, or
    // one comes again before the others, which are damaged then.
    bool add(const Bytes& section);

    const ApplicationList& list() const { return m_list; }

private:
    bool onDamage();
    bool makeList();

    int m_version = -1;                  // of the sections; -1: none
    std::map<uint8_t, Bytes> m_sections; // by section number
    bool m_isDamaged = false;            // a section is malformed
    bool m_isListed = false;             // the list is that of this version
    ApplicationList m_list;
};

// Whether a stream of the PMT carries an AIT with HbbTV applications.
bool carriesApplications(const ElementaryStream& stream);

} // namespace desktop

#endif
