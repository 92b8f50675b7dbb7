#include "Requests.h"

#include "Completion.h"
#include "Delivery.h"
#include "Links.h"
#include "Lookup.h"

namespace ZR::DHCPClientGateway {

namespace {

void enumerateTo(const Request& request, const ServedClass& served, const Delivery& delivery) {
    if (served.server == Server::gateway) {
        for (const Link& link : allLinks(request, *findAssociation(served))) {
            delivery.give(served, objectOf(request, link, delivery.form()));
        }
        return;
    }
    askEach(request, served, delivery.form(), {},
            [&](const CMPIObjectPath* path, const CMPIInstance* instance) {
                delivery.give(served, {path, instance, {}});
            });
}

}  // namespace

void enumerateNames(const Request& request) {
    enumerateTo(request, servedClassOf(request), Delivery(request));
}

void enumerate(const Request& request, const char** properties) {
    enumerateTo(request, servedClassOf(request), Delivery(request, properties));
}

void get(const Request& request, const char** properties) {
    const ServedClass& served = servedClassOf(request);
    const Delivery delivery(request, properties);
    delivery.give(served, served.server == Server::gateway
                              ? objectOf(request, findLink(request, served), Form::instances)
                              : find(request, served, Form::instances));
}

}  // namespace ZR::DHCPClientGateway
