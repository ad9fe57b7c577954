// What the eleven association adapters share.
//
// An association adapter is built from the source path of an association request. It owns the
// association's model (which turns one end's moniker into the other's) and one adapter per end:
// an instance adapter for ends this provider serves, a lookup adapter (CMPIIPComputerSystem,
// CMPIIPLanEndPoint) for ends other providers serve. The class of the source path decides which
// end is fed from the path, which one is located through the model, and which one is walked:
//   - the source is one end: that end is positioned on the path, the other end is located from
//     it and walked; it is the far end that associators report;
//   - the source is the association class: the adapter walks one end and pairs it with the other
//     as its constructor states (the walked end moves, the other stays where it was put);
//   - any other class: neither end is positioned and the adapter yields nothing.
// A derived adapter names its class and ends (AssociationClass), its locate operations and its
// construction by class id; it may add the association's own properties by defining
// setAssociationProperties.
#pragma once

#include <cmpidt.h>
#include <cmpift.h>
#include <strings.h>

#include <functional>
#include <initializer_list>
#include <string>

#include "CMPI/CMPIAdapter.h"
#include "CMPI/CMPIAssignmentSettingData.h"
#include "CMPI/CMPIIPComputerSystem.h"
#include "CMPI/CMPIIPLanEndPoint.h"
#include "IPInterfaceProvider.h"
#include "Nx/Moniker.h"
#include "Nx/ProviderUtilities.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

// One end of an association class.
struct AssociationEnd {
    unsigned short classId;       // the class of a source path that is this end
    const char* className;        // the class the located paths of this end are made of
    const char* parentClassName;  // its direct CIM parent; with className, the accepted result classes
    const char* referenceName;    // the association's reference to this end
};

struct AssociationClass {
    const char* className;
    AssociationEnd a;
    AssociationEnd b;
    bool bReferenceFirst;  // the object path carries b's reference before a's
};

enum class Side { None, A, B };

// Positioning an end adapter on a path (a located one or the request's own). The assignment
// setting adapter is positioned exactly; the computer system lookup takes the first system
// enumerated; a LAN endpoint path with keys is fetched, and a bare class path (which names no
// endpoint to fetch) enumerated.
inline void positionAt(CMPIAssignmentSettingData& end, const CMPIObjectPath* path) { end.setObjectPath(path, false); }
inline void positionAt(CMPIIPComputerSystem& end, const CMPIObjectPath* path) { end.setObjectPath(path, false); }
inline void positionAt(CMPIIPLanEndPoint& end, const CMPIObjectPath* path) {
    if (ProviderUtilities::getKeyCount(path) != 0)
        end.setSingleObjectPath(path);
    else
        end.setObjectPath(path);
}
template <class End>
void positionAt(End& end, const CMPIObjectPath* path) {
    end.setObjectPath(path);
}

// Whether an end adapter stands on an element. The computer system lookup is asked for its path,
// since its operator bool consumes the initial-load state that its iteration relies on.
inline bool standsOnElement(CMPIIPComputerSystem& end) { return end.getObjectPath() != nullptr; }
template <class End>
bool standsOnElement(End& end) {
    return static_cast<bool>(end);
}

template <class Derived, class Model, class EndA, class EndB>
class CMPIAssociationAdapter {
public:
    CMPIAssociationAdapter(const CMPIAssociationAdapter&) = delete;
    CMPIAssociationAdapter& operator=(const CMPIAssociationAdapter&) = delete;

    explicit operator bool() {
        tracer(__func__, __LINE__, ENTERING);
        bool current = false;
        if (walked == Side::A) current = static_cast<bool>(endA);
        if (walked == Side::B) current = static_cast<bool>(endB);
        tracer(__func__, __LINE__, EXITING);
        return current;
    }

    void operator++() {
        tracer(__func__, __LINE__, ENTERING);
        if (walked == Side::A) ++endA;
        if (walked == Side::B) ++endB;
        tracer(__func__, __LINE__, EXITING);
    }

    // True when resultClass can never be the class of the far end. Only the far end's own class
    // and its direct CIM parent are accepted, in any case. resultClass must not be null.
    bool isNotTargetClass(const char* resultClass) const {
        const TraceParams params(" resultClass=", resultClass);
        tracer(__func__, __LINE__, ENTERING, params);
        bool notTarget = true;
        if (const AssociationEnd* far = farEnd())
            notTarget =
                ::strcasecmp(resultClass, far->className) != 0 && ::strcasecmp(resultClass, far->parentClassName) != 0;
        tracer(__func__, __LINE__, EXITING, params);
        return notTarget;
    }

    // The far end's current element; null when the source was not one of the ends.
    CMPIObjectPath* getAssociatorNames() {
        tracer(__func__, __LINE__, ENTERING);
        CMPIObjectPath* path = nullptr;
        if (requestedClassId == association.a.classId) path = endB.getObjectPath();
        if (requestedClassId == association.b.classId) path = endA.getObjectPath();
        tracer(__func__, __LINE__, EXITING);
        return path;
    }

    CMPIInstance* getAssociator(const char** properties) {
        const TraceParams params(" properties=", properties);
        tracer(__func__, __LINE__, ENTERING, params);
        CMPIInstance* instance = nullptr;
        if (requestedClassId == association.a.classId) instance = endB.getCMPIInstance(properties);
        if (requestedClassId == association.b.classId) instance = endA.getCMPIInstance(properties);
        tracer(__func__, __LINE__, EXITING, params);
        return instance;
    }

    // A path of the association class with its two references to the current pair.
    CMPIObjectPath* getObjectPath() {
        tracer(__func__, __LINE__, ENTERING);
        CMPIObjectPath* path = ProviderUtilities::createObjectPath(broker, association.className, nameSpace);
        if (path) {
            CMPIObjectPath* toA = endA.getObjectPath();
            CMPIObjectPath* toB = endB.getObjectPath();
            if (association.bReferenceFirst) ProviderUtilities::setKeyProperty(path, association.b.referenceName, toB);
            ProviderUtilities::setKeyProperty(path, association.a.referenceName, toA);
            if (!association.bReferenceFirst) ProviderUtilities::setKeyProperty(path, association.b.referenceName, toB);
        }
        tracer(__func__, __LINE__, EXITING);
        return path;
    }

    // The association instance: its references and its own properties.
    CMPIInstance* getCMPIInstance(const char** properties) {
        const TraceParams params(" properties=", properties);
        tracer(__func__, __LINE__, ENTERING, params);
        CMPIObjectPath* path = getObjectPath();
        CMPIInstance* instance = ProviderUtilities::createInstance(broker, path);
        if (instance) {
            for (const char* reference : {association.a.referenceName, association.b.referenceName}) {
                CMPIObjectPath* target = nullptr;
                if (ProviderUtilities::getKeyProperty(path, reference, target))
                    ProviderUtilities::setProperty(instance, reference, target);
            }
            static_cast<Derived*>(this)->setAssociationProperties(instance);
        }
        tracer(__func__, __LINE__, EXITING, params);
        return instance;
    }

protected:
    CMPIAssociationAdapter(const CMPIBroker* broker_, const CMPIContext* context_, const CMPIObjectPath* path,
                           const AssociationClass& association_, const std::string& logger, const char* file)
        : broker(broker_),
          context(context_),
          nameSpace(ProviderUtilities::getNamespace(path)),
          model(),
          requestedClassId(ProviderUtilities::getClassId(path)),
          endA(broker_, context_, nameSpace),
          endB(broker_, context_, nameSpace),
          association(association_),
          tracer(logger, file) {
        tracer.variable("CMPIAssociationAdapter", __LINE__, "requestedClassId",
                        static_cast<unsigned>(requestedClassId));
    }
    ~CMPIAssociationAdapter() = default;

    // No properties of its own unless the association has some.
    void setAssociationProperties(CMPIInstance*) {}

    // Sets a property of the association from the model's getter; left unset when the getter
    // reports failure.
    template <class Value, class Getter>
    void copyProperty(CMPIInstance* instance, const char* name, Getter getter) {
        copyModelProperty<Value>(model, instance, name, getter);
    }

    // The trace of the derived constructor function around positioning, which body does.
    template <class Body>
    void construct(const char* function, const CMPIObjectPath* path, Body body) {
        tracer.construction(function, broker, context, " objectPath=", path, body);
    }

    // The construction of the associations anchored on one element (see setAnchoredObjectPath):
    // a source that is one end is positioned as that end; one of the association class
    // (associationId) as setObjectPath positions it or, when that returns false, as end A.
    template <class LocateA, class LocateB>
    void constructAnchored(const char* function, const CMPIObjectPath* path, unsigned short associationId,
                           LocateA locateA, LocateB locateB) {
        construct(function, path, [&] {
            if (requestedClassId == association.b.classId)
                fromB(path, locateA);
            else if (requestedClassId == association.a.classId ||
                     (requestedClassId == associationId && !derived().setObjectPath(path)))
                fromA(path, locateB);
        });
    }

    // A class path of farClass for the far end of source. When source has keys, the model
    // converts its moniker into the far end's keys; without keys the bare class path stands for
    // every element of the far class. The model's exceptions pass.
    template <class Convert>
    CMPIObjectPath* locate(const CMPIObjectPath* source, const char* farClass, Convert convert,
                           const char* conversion) {
        const TraceParams params(" objectPath=", source, " farClass=", farClass);
        tracer(__func__, __LINE__, ENTERING, params);
        CMPIObjectPath* far = ProviderUtilities::createObjectPath(broker, farClass, nameSpace);
        if (ProviderUtilities::getKeyCount(source) != 0) {
            Nx::Moniker moniker = ProviderUtilities::transformObjectPathToMoniker(source);
            Nx::Moniker located = std::invoke(convert, model, moniker);
            if (tracing(3000))
                tracer.message(__func__, __LINE__, 3000, (std::string("Returned from ") + conversion).c_str());
            if (far) ProviderUtilities::transformMonikerToObjectPath(located, far);
        }
        tracer(__func__, __LINE__, EXITING, params);
        return far;
    }

    // The source is end A: B is located from it and walked.
    template <class LocateB>
    void fromA(const CMPIObjectPath* path, LocateB locateB) {
        positionAt(endB, std::invoke(locateB, derived(), path));
        positionAt(endA, path);
        walked = Side::B;
    }
    // The source is end B: A is located from it and walked.
    template <class LocateA>
    void fromB(const CMPIObjectPath* path, LocateA locateA) {
        positionAt(endA, std::invoke(locateA, derived(), path));
        positionAt(endB, path);
        walked = Side::A;
    }
    // The association class: end A is walked, B is located from A's first element.
    template <class LocateB>
    void walkA(LocateB locateB) {
        if (endA) positionAt(endB, std::invoke(locateB, derived(), endA.getObjectPath()));
        walked = Side::A;
    }
    template <class LocateA>
    void walkB(LocateA locateA) {
        if (endB) positionAt(endA, std::invoke(locateA, derived(), endB.getObjectPath()));
        walked = Side::B;
    }
    void walk(Side side) { walked = side; }

    // The association class, for the associations anchored on one element (the computer system
    // hosting endpoints, say). A path without keys: the anchor end is enumerated and the member
    // end located from its first element and walked; true. A path with keys (one association
    // instance): the member end is positioned on the member reference and the anchor located from
    // it; when the anchor reference names the same anchor (identityKey of both), the anchor end is
    // positioned on it. False: the caller goes on as for its fallback source class.
    template <Side AnchorSide, class LocateMember, class LocateAnchor>
    bool setAnchoredObjectPath(const CMPIObjectPath* path, const char* identityKey, LocateMember locateMember,
                               LocateAnchor locateAnchor) {
        constexpr Side MemberSide = AnchorSide == Side::A ? Side::B : Side::A;
        auto& anchor = end<AnchorSide>();
        auto& member = end<MemberSide>();
        const AssociationEnd& anchorEnd = AnchorSide == Side::A ? association.a : association.b;
        const AssociationEnd& memberEnd = AnchorSide == Side::A ? association.b : association.a;
        const TraceParams params(" objectPath=", path);
        tracer(__func__, __LINE__, ENTERING, params);
        walked = MemberSide;
        bool positioned = false;
        if (ProviderUtilities::getKeyCount(path) == 0) {
            positionAt(anchor, ProviderUtilities::createObjectPath(broker, anchorEnd.className, nameSpace));
            if (standsOnElement(anchor))
                positionAt(member, std::invoke(locateMember, derived(), anchor.getObjectPath()));
            positioned = true;
        } else {
            CMPIObjectPath* memberReference = nullptr;
            CMPIObjectPath* located = nullptr;
            if (ProviderUtilities::getKeyProperty(path, memberEnd.referenceName, memberReference)) {
                positionAt(member, memberReference);
                located = std::invoke(locateAnchor, derived(), memberReference);
            }
            CMPIObjectPath* anchorReference = nullptr;
            std::string given, expected;
            if (ProviderUtilities::getKeyProperty(path, anchorEnd.referenceName, anchorReference) &&
                ProviderUtilities::getKeyProperty(anchorReference, identityKey, given) &&
                ProviderUtilities::getKeyProperty(located, identityKey, expected) && given == expected)
                positionOnAnchor(anchor, anchorReference);
        }
        tracer(__func__, __LINE__, EXITING, params);
        return positioned;
    }

    const CMPIBroker* broker;
    const CMPIContext* context;
    std::string nameSpace;
    Model model;
    unsigned short requestedClassId;
    EndA endA;
    EndB endB;

private:
    Derived& derived() { return static_cast<Derived&>(*this); }

    template <Side S>
    auto& end() {
        if constexpr (S == Side::A)
            return endA;
        else
            return endB;
    }

    // An anchor named by an association instance: a computer system is picked out by name.
    static void positionOnAnchor(CMPIIPComputerSystem& anchor, const CMPIObjectPath* path) {
        anchor.setObjectPath(path, true);
    }
    template <class Anchor>
    static void positionOnAnchor(Anchor& anchor, const CMPIObjectPath* path) {
        positionAt(anchor, path);
    }

    const AssociationEnd* farEnd() const {
        if (requestedClassId == association.a.classId) return &association.b;
        if (requestedClassId == association.b.classId) return &association.a;
        return nullptr;
    }

    const AssociationClass& association;
    Side walked = Side::None;
    AdapterTrace tracer;
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
