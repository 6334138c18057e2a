// What the scripts of the demonstration and the examples of the reference find in their pages beside the objects' members.

interface Document {
    getElementById(id: 'manager'): telix.ApplicationManager;
    getElementById(id: 'configuration'): telix.OipfConfiguration;
    getElementById(id: 'capabilities'): telix.Capabilities;
    getElementById(id: 'parental'): telix.ParentalControlManager;
    getElementById(id: 'agent'): telix.DRMAgent;
    getElementById(id: 'video'): telix.VideoBroadcast;
    getElementById(id: 'player'): telix.AVControl;
}

declare namespace telix {
    // Set by the demonstration.
    interface VideoBroadcast {
        hasPlugin: boolean;
    }
    interface AVControl {
        hasPlugin: boolean;
    }
}

// Key codes of the browser of a set.
declare const VK_BACK: number;
declare const VK_ENTER: number;
interface Window {
    VK_0?: number;
}
