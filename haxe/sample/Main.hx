import tarnwick.Achievement;
import tarnwick.Eos;
import tarnwick.Friend;
import tarnwick.Result;

/**
	A small game loop against tarnwick: signs in, lists friends and
	achievements, opens a lobby that publishes this host's address, invites
	the first friend who is playing, and joins the lobby of an invitation it
	receives while it hosts none. Settings come from the environment
	(TARNWICK_PRODUCT_ID, ...).
**/
class Main {
	static var running = true;
	static var lobbyId:Null<String>;

	static function env(name:String, fallback:String):String {
		var v = Sys.getEnv(name);
		return v == null ? fallback : v;
	}

	static function main() {
		var config:tarnwick.Config = {
			productName: "Tarnwick Sample",
			productVersion: "1.0",
			productId: env("TARNWICK_PRODUCT_ID", "sample-product"),
			sandboxId: env("TARNWICK_SANDBOX_ID", "sample-sandbox"),
			deploymentId: env("TARNWICK_DEPLOYMENT_ID", "sample-deployment"),
			clientId: env("TARNWICK_CLIENT_ID", "sample-client"),
			clientSecret: env("TARNWICK_CLIENT_SECRET", "sample-secret"),
			loginType: Developer,
			loginId: env("TARNWICK_LOGIN_ID", "localhost:6547"),
			loginToken: env("TARNWICK_LOGIN_TOKEN", "player1"),
			enableOverlay: false,
		};

		Eos.onInviteReceived(function(inviteId, sender) {
			if (lobbyId != null) {
				trace('Invitation from $sender declined: already hosting');
				Eos.rejectInvite(inviteId);
				return;
			}
			trace('Invitation from $sender; joining');
			Eos.acceptInvite(inviteId, joined);
		});
		Eos.onInviteAccepted(joined);

		if (!Eos.init(config, signedIn)) {
			trace("EOS could not start");
			return;
		}

		var frames = Std.parseInt(env("TARNWICK_FRAMES", "600"));
		while (running && frames-- > 0) {
			Eos.update();
			Sys.sleep(1 / 60);
		}
		if (lobbyId != null) {
			var closed = false;
			Eos.destroyLobby(lobbyId, function(r) {
				trace('Lobby closed: $r');
				closed = true;
			});
			while (!closed && frames-- > -60) {
				Eos.update();
				Sys.sleep(1 / 60);
			}
		}
		Eos.exit();
	}

	static function signedIn(result:Result, epicId:Null<String>, name:String, token:Null<String>) {
		if (!result.isSuccess()) {
			trace('Sign-in failed: $result');
			running = false;
			return;
		}
		trace('Signed in as $name ($epicId)');
		Eos.unlockAchievement("first_login");
		Eos.queryAchievements(listAchievements);
		Eos.queryOwnership(["base_game", "soundtrack"], function(owned) {
			if (owned == null)
				trace("Ownership unknown");
			else
				trace('Owned: ' + owned.join(", "));
			if (owned != null && owned.indexOf("soundtrack") < 0 && Sys.getEnv("TARNWICK_SHOP") == "1")
				Eos.checkout("soundtrack_offer");
		});
		Eos.createLobby("udp://198.51.100.7:7777", function(id) {
			if (id == null) {
				trace("No lobby");
				return;
			}
			lobbyId = id;
			trace('Hosting lobby $id');
			Eos.queryFriends(inviteFirstOnlineFriend);
		});
	}

	static function listAchievements(achievements:Array<Achievement>) {
		for (a in achievements)
			trace('${a.id}: ' + (a.unlock == true ? "unlocked" : "locked"));
	}

	static function inviteFirstOnlineFriend(friends:Null<Array<Friend>>) {
		if (friends == null) {
			trace("Friend list unavailable");
			return;
		}
		for (f in friends) {
			trace(f.name + (f.online == true ? " (playing)" : ""));
			if (f.online == true && f.productId != null && lobbyId != null) {
				Eos.sendInvite(f.productId, lobbyId);
				return;
			}
		}
		Eos.showFriends();
	}

	static function joined(lobby:String, connectionKey:Null<String>) {
		trace('Joined lobby $lobby; connecting to $connectionKey');
		// A real game would connect to the host here; this one just leaves again.
		Eos.leaveLobby(lobby, function(r) trace('Left lobby: $r'));
	}
}
