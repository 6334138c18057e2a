// The longer page scripts. Pages on sets in the field rely on them byte for byte,
// inconsistencies included.
#include "common/PageScripts.h"

#include <cassert>

std::string fillIn(std::string_view script, std::initializer_list<std::string_view> arguments) {
    std::string line;
    auto argument = arguments.begin();
    for (size_t i = 0; i < script.size(); ++i) {
        if (script.substr(i, 2) == "@@") {
            assert(argument != arguments.end());
            line += *argument++;
            ++i;
        } else if (script[i] != '\n') {
            line += script[i];
        }
    }
    assert(argument == arguments.end());
    return line;
}

// Fetches the description and looks for the event in its XML form, then in its comma-separated form.
// quirk 12: names that are not declared become globals of the page.
// quirk 92: the loop over the comma-separated form compares `event`, not the entry just split.
const std::string_view kStreamEventRequestScript = R"js(
var requestURL = '@@'; var eventName = '@@';
var httpReq = new XMLHttpRequest();
httpReq.open('GET', requestURL, true);
httpReq.onreadystatechange = function(){
	if((httpReq.readyState == 4) && (httpReq.status == 200)){
		var eventId_val = null;
		var comp_tag_val = null;
		if(xmlData = httpReq.responseXML){
			var stream_event_type_elem =  xmlData.getElementsByTagName('stream_event');
			for(i=0; i < stream_event_type_elem.length; i++){
				if(stream_event_type_elem[i].getAttribute('stream_event_name') == eventName){
					eventId_val = stream_event_type_elem[i].getAttribute('stream_event_id');
					var stream_event_elem = stream_event_type_elem[i].parentNode;
					if(stream_event_elem)
						comp_tag_val = stream_event_elem.getAttribute('component_tag');
					break;
				}
			}
		}
		if(!eventId_val || !comp_tag_val){
			if(respText = httpReq.responseText){
				var eventset = respText.split(',');
				for(i=0; i < eventset.length - 1; i++){
					eventToken = eventset[i].split('.', 2);
					if(eventName == event[1]){
						eventId_val = event[0];
						break;
					}
				}
				compToken = eventset[eventset.length - 1];
				eventToken = compToken.split('$');
				comp_tag_val = eventToken[1];
				if(null == eventId_val){
					event = eventToken[0].split('.', 2);
					if(event[1] == eventName)
						eventId_val = event[0];
				}
			}
		}
var objElem = document.getElementById('@@');
objElem.@@(requestURL, eventName, eventId_val, comp_tag_val);
}
};
httpReq.send(null);
)js";

// quirk 66: the first `param` child counts, whatever its name.
const std::string_view kPlayCountScript = R"js(
window.getPlayCountVal = function()
{
	var objElem = document.getElementById("@@");
	var nodeList = objElem.childNodes;
	for( var i = 0; i < nodeList.length ; i++)
	{
		var paramElem = nodeList.item(i);
		if( 'param' == paramElem.nodeName || 'PARAM' == paramElem.nodeName)
		{
			var loopStr = paramElem.getAttribute('value');
			return loopStr;
		}
	}
};
)js";

const std::string_view kEncodedUrlScript = R"js(
window.getEncodedURL = function()
{
	var encodedURL = encodeURI("@@");
	return encodedURL;
};
)js";
